#include "adm/ADMAudioPackFormat.h"

#include "adm/ADMAttributes.h"
#include "adm/ADMAudioChannelFormat.h"
#include "adm/ADMIdentifier.h"
#include "adm/ADMSubElements.h"
#include "adm/ADMText.h"

using platform::XMLAttributes;

std::unique_ptr<ADMAudioPackFormat> ADMAudioPackFormat::audioPackFormatWithAttributes(const XMLAttributes& attributes)
{
    return std::make_unique<ADMAudioPackFormat>(attributes);
}

ADMAudioPackFormat::ADMAudioPackFormat(const XMLAttributes& attributes)
    : audioPackFormatID_(ADMGetRequiredAttribute(attributes, "audioPackFormatID")),
      audioPackFormatName_(ADMGetRequiredAttribute(attributes, "audioPackFormatName")),
      type_(ADMGetTypeFromRequiredTypeLabelOrName(attributes, audioPackFormatID_)),
      importance_(static_cast<std::uint64_t>(adm::integerOf(*ADMGetAttribute(attributes, "importance", "10"))))
{
}

void ADMAudioPackFormat::setSubElement(std::string_view name, std::string_view value, const XMLAttributes& attributes)
{
    static constexpr adm::SubElement<ADMAudioPackFormat> table[] = {
        {"absoluteDistance", &ADMAudioPackFormat::addSubElement_absoluteDistance},
        {"audioChannelFormatIDRef", &ADMAudioPackFormat::addSubElement_audioChannelFormatIDRef},
        {"audioPackFormatIDRef", &ADMAudioPackFormat::addSubElement_audioPackFormatIDRef},
    };
    adm::addSubElement(*this, table, name, value, attributes);
}

void ADMAudioPackFormat::addSubElement_absoluteDistance(std::string_view value, const XMLAttributes&)
{
    absoluteDistance_ = adm::floatOf(value);
}

void ADMAudioPackFormat::addSubElement_audioChannelFormatIDRef(std::string_view value, const XMLAttributes&)
{
    audioChannelFormats_.ids.emplace_back(value);
}

void ADMAudioPackFormat::addSubElement_audioPackFormatIDRef(std::string_view value, const XMLAttributes&)
{
    audioPackFormats_.ids.emplace_back(value);
}

void ADMAudioPackFormat::resolveIDRefsWithResolver(ADMElementResolver& resolver)
{
    audioChannelFormats_.resolve(resolver, kADMAudioChannelFormatPrefix);
    audioPackFormats_.resolve(resolver, kADMAudioPackFormatPrefix);
}

void ADMAudioPackFormat::announceIDRefsToResolver(ADMElementResolver& resolver) const
{
    audioChannelFormats_.announce(resolver, kADMAudioChannelFormatPrefix);
    audioPackFormats_.announce(resolver, kADMAudioPackFormatPrefix);
}

std::string ADMAudioPackFormat::description() const
{
    // Kept: the class is not called by its whole name.
    return "<AudioPackFormat: " + adm::addressText(this) + ", ID: " + audioPackFormatID_ +
           ", Name: " + audioPackFormatName_ + ", Type: " + ADMGetNameForType(type_) +
           ", importance = " + std::to_string(importance_) +
           ", absoluteDistance = " + adm::fixedText(absoluteDistance_) +
           "\naudioChannelFormats=" + adm::linksText(audioChannelFormats()) +
           ", audioPackFormats=" + adm::linksText(audioPackFormats()) + ">";
}
