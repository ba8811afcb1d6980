#include "adm/ADMAudioTrackUID.h"

#include "adm/ADMAttributes.h"
#include "adm/ADMAudioChannelFormat.h"
#include "adm/ADMAudioPackFormat.h"
#include "adm/ADMAudioTrackFormat.h"
#include "adm/ADMIdentifier.h"
#include "adm/ADMSubElements.h"
#include "adm/ADMText.h"

using platform::XMLAttributes;

std::unique_ptr<ADMAudioTrackUID> ADMAudioTrackUID::audioTrackUIDWithAttributes(const XMLAttributes& attributes)
{
    return std::make_unique<ADMAudioTrackUID>(attributes);
}

ADMAudioTrackUID::ADMAudioTrackUID(const XMLAttributes& attributes)
    : audioTrackUIDID_(ADMGetRequiredAttribute(attributes, "UID"))
{
    ADMRequirePrefix(adm::parseIdentifier(audioTrackUIDID_, nullptr, &index_, nullptr), kADMAudioTrackUIDPrefix,
                     "audioTrackUID");
    sampleRate_ = adm::integerOf(*ADMGetAttribute(attributes, "sampleRate", "0"));
    bitDepth_ = adm::integerOf(*ADMGetAttribute(attributes, "bitDepth", "0"));
}

void ADMAudioTrackUID::setSubElement(std::string_view name, std::string_view value, const XMLAttributes& attributes)
{
    static constexpr adm::SubElement<ADMAudioTrackUID> table[] = {
        {"audioTrackFormatIDRef", &ADMAudioTrackUID::addSubElement_audioTrackFormatIDRef},
        {"audioChannelFormatIDRef", &ADMAudioTrackUID::addSubElement_audioChannelFormatIDRef},
        {"audioPackFormatIDRef", &ADMAudioTrackUID::addSubElement_audioPackFormatIDRef},
    };
    adm::addSubElement(*this, table, name, value, attributes);
}

void ADMAudioTrackUID::addSubElement_audioTrackFormatIDRef(std::string_view value, const XMLAttributes&)
{
    audioTrackFormat_.id = value;
}

void ADMAudioTrackUID::addSubElement_audioChannelFormatIDRef(std::string_view value, const XMLAttributes&)
{
    audioChannelFormat_.id = value;
}

void ADMAudioTrackUID::addSubElement_audioPackFormatIDRef(std::string_view value, const XMLAttributes&)
{
    audioPackFormat_.id = value;
}

void ADMAudioTrackUID::resolveIDRefsWithResolver(ADMElementResolver& resolver)
{
    audioTrackFormat_.resolve(resolver, kADMAudioTrackFormatPrefix);
    audioChannelFormat_.resolve(resolver, kADMAudioChannelFormatPrefix);
    audioPackFormat_.resolve(resolver, kADMAudioPackFormatPrefix);
}

void ADMAudioTrackUID::announceIDRefsToResolver(ADMElementResolver& resolver) const
{
    audioTrackFormat_.announce(resolver, kADMAudioTrackFormatPrefix);
    audioChannelFormat_.announce(resolver, kADMAudioChannelFormatPrefix);
    audioPackFormat_.announce(resolver, kADMAudioPackFormatPrefix);
}

std::string ADMAudioTrackUID::description() const
{
    return "<ADMAudioTrackUID: " + adm::addressText(this) + ", ID: " + audioTrackUIDID_ +
           ", sampleRate: " + std::to_string(sampleRate_) + ", bitDepth: " + std::to_string(bitDepth_) +
           ",\n audioTrackFormat: " + adm::linkText(audioTrackFormat()) +
           ",\n audioChannelFormat: " + adm::linkText(audioChannelFormat()) +
           ",\n audioPackFormat: " + adm::linkText(audioPackFormat()) + ">";
}
