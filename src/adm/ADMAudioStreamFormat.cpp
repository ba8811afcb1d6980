#include "adm/ADMAudioStreamFormat.h"

#include "adm/ADMAttributes.h"
#include "adm/ADMAudioChannelFormat.h"
#include "adm/ADMAudioPackFormat.h"
#include "adm/ADMAudioTrackFormat.h"
#include "adm/ADMException.h"
#include "adm/ADMIdentifier.h"
#include "adm/ADMSubElements.h"
#include "adm/ADMText.h"
#include "adm/ADMTypes.h"

using platform::XMLAttributes;

std::unique_ptr<ADMAudioStreamFormat>
ADMAudioStreamFormat::audioStreamFormatWithAttributes(const XMLAttributes& attributes)
{
    return std::make_unique<ADMAudioStreamFormat>(attributes);
}

ADMAudioStreamFormat::ADMAudioStreamFormat(const XMLAttributes& attributes)
    : audioStreamFormatID_(ADMGetRequiredAttribute(attributes, "audioStreamFormatID")),
      audioStreamFormatName_(ADMGetRequiredAttribute(attributes, "audioStreamFormatName")),
      format_(ADMGetFormatFromRequiredFormatLabelOrName(attributes, audioStreamFormatID_))
{
    if (format_ != kADMFormatPCM)
        throw ADMException(kADMExceptionUnsupportedDefinition,
                           "unsupported data format " + adm::hexText(format_) + " found in " + audioStreamFormatID_);
}

void ADMAudioStreamFormat::setSubElement(std::string_view name, std::string_view value, const XMLAttributes& attributes)
{
    static constexpr adm::SubElement<ADMAudioStreamFormat> table[] = {
        {"audioChannelFormatIDRef", &ADMAudioStreamFormat::addSubElement_audioChannelFormatIDRef},
        {"audioPackFormatIDRef", &ADMAudioStreamFormat::addSubElement_audioPackFormatIDRef},
        {"audioTrackFormatIDRef", &ADMAudioStreamFormat::addSubElement_audioTrackFormatIDRef},
    };
    adm::addSubElement(*this, table, name, value, attributes);
}

void ADMAudioStreamFormat::addSubElement_audioChannelFormatIDRef(std::string_view value, const XMLAttributes&)
{
    audioChannelFormat_.id = value;
}

void ADMAudioStreamFormat::addSubElement_audioPackFormatIDRef(std::string_view value, const XMLAttributes&)
{
    audioPackFormat_.id = value;
}

void ADMAudioStreamFormat::addSubElement_audioTrackFormatIDRef(std::string_view value, const XMLAttributes&)
{
    audioTrackFormats_.ids.emplace_back(value);
}

void ADMAudioStreamFormat::resolveIDRefsWithResolver(ADMElementResolver& resolver)
{
    audioChannelFormat_.resolve(resolver, kADMAudioChannelFormatPrefix);
    audioPackFormat_.resolve(resolver, kADMAudioPackFormatPrefix);
    audioTrackFormats_.resolve(resolver, kADMAudioTrackFormatPrefix);
}

void ADMAudioStreamFormat::announceIDRefsToResolver(ADMElementResolver& resolver) const
{
    audioChannelFormat_.announce(resolver, kADMAudioChannelFormatPrefix);
    audioPackFormat_.announce(resolver, kADMAudioPackFormatPrefix);
    audioTrackFormats_.announce(resolver, kADMAudioTrackFormatPrefix);
}

std::string ADMAudioStreamFormat::description() const
{
    return "<AudioStreamFormat: " + adm::addressText(this) + ", ID: " + audioStreamFormatID_ +
           ", Name: " + audioStreamFormatName_ + ", Format: " + ADMGetNameForFormat(format_) +
           "\naudioChannelFormat=" + adm::linkText(audioChannelFormat()) +
           ", audioPackFormat=" + adm::linkText(audioPackFormat()) +
           ", audioTrackFormats=" + adm::linksText(audioTrackFormats()) + ">";
}
