#include "adm/ADMAudioChannelFormat.h"

#include "adm/ADMAttributes.h"
#include "adm/ADMText.h"

using platform::XMLAttributes;

std::unique_ptr<ADMAudioChannelFormat>
ADMAudioChannelFormat::audioChannelFormatWithAttributes(const XMLAttributes& attributes)
{
    return std::make_unique<ADMAudioChannelFormat>(attributes);
}

ADMAudioChannelFormat::ADMAudioChannelFormat(const XMLAttributes& attributes)
    : audioChannelFormatID_(ADMGetRequiredAttribute(attributes, "audioChannelFormatID")),
      audioChannelFormatName_(ADMGetRequiredAttribute(attributes, "audioChannelFormatName")),
      type_(ADMGetTypeFromRequiredTypeLabelOrName(attributes, audioChannelFormatID_))
{
}

void ADMAudioChannelFormat::addAudioBlockFormat(std::unique_ptr<ADMAudioBlockFormat> block)
{
    audioBlockFormat_.push_back(std::move(block));
}

std::string ADMAudioChannelFormat::description() const
{
    std::string blocks = "(";
    for (const auto& block : audioBlockFormat_) {
        if (blocks.size() > 1)
            blocks += ", ";
        blocks += block->description();
    }
    return "<ADMAudioChannelFormat: " + adm::addressText(this) + ", Name: " + audioChannelFormatName_ +
           ", Type: " + ADMGetNameForType(type_) + ", has audioBlockFormats: " + blocks + ")>";
}
