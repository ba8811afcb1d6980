#include "adm/ADMAudioBlockFormat_DirectSpeaker.h"

#include "adm/ADMText.h"

ADMAudioBlockFormat_DirectSpeaker::~ADMAudioBlockFormat_DirectSpeaker() = default;

void ADMAudioBlockFormat_DirectSpeaker::setSubElement(std::string_view name, std::string_view value,
                                                      const platform::XMLAttributes& attributes)
{
    if (name == "speakerLabel")
        speakerLabel_ = value;
    else
        ADMAudioBlockFormat::setSubElement(name, value, attributes);
}

std::string ADMAudioBlockFormat_DirectSpeaker::description() const
{
    return "<ADMAudioBlockFormat_DirectSpeaker: " + commonDescription() + ", label = " + adm::orNull(speakerLabel_) +
           ", position = " + position_.description() + ">";
}
