#include "adm/ADMAudioTrackFormat.h"

#include "adm/ADMAttributes.h"
#include "adm/ADMAudioStreamFormat.h"
#include "adm/ADMException.h"
#include "adm/ADMIdentifier.h"
#include "adm/ADMSubElements.h"

using platform::XMLAttributes;

std::unique_ptr<ADMAudioTrackFormat>
ADMAudioTrackFormat::audioTrackFormatWithAttributes(const XMLAttributes& attributes)
{
    return std::make_unique<ADMAudioTrackFormat>(attributes);
}

ADMAudioTrackFormat::ADMAudioTrackFormat(const XMLAttributes& attributes)
    : audioTrackFormatID_(ADMGetRequiredAttribute(attributes, "audioTrackFormatID")),
      audioTrackFormatName_(ADMGetRequiredAttribute(attributes, "audioTrackFormatName"))
{
    if (const auto formatLabel = ADMGetAttribute(attributes, "formatLabel"))
        formatLabel_ = *formatLabel;
    if (const auto formatDefinition = ADMGetAttribute(attributes, "formatDefinition"))
        formatDefinition_ = *formatDefinition;
}

void ADMAudioTrackFormat::setSubElement(std::string_view name, std::string_view value, const XMLAttributes& attributes)
{
    static constexpr adm::SubElement<ADMAudioTrackFormat> table[] = {
        {"audioStreamFormatIDRef", &ADMAudioTrackFormat::addSubElement_audioStreamFormatIDRef},
    };
    adm::addSubElement(*this, table, name, value, attributes);
}

void ADMAudioTrackFormat::addSubElement_audioStreamFormatIDRef(std::string_view value, const XMLAttributes&)
{
    if (audioStreamFormat_.id && *audioStreamFormat_.id != value)
        throw ADMException(kADMExceptionMalformedDefinition, "only one audioStreamFormatIDRef expected",
                           {{"audioTrackFormat", audioTrackFormatID_}});
    audioStreamFormat_.id = value;
}

void ADMAudioTrackFormat::resolveIDRefsWithResolver(ADMElementResolver& resolver)
{
    audioStreamFormat_.resolve(resolver, kADMAudioStreamFormatPrefix);
}

void ADMAudioTrackFormat::announceIDRefsToResolver(ADMElementResolver& resolver) const
{
    audioStreamFormat_.announce(resolver, kADMAudioStreamFormatPrefix);
}
