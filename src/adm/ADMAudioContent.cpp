#include "adm/ADMAudioContent.h"

#include "adm/ADMAttributes.h"
#include "adm/ADMAudioObject.h"
#include "adm/ADMIdentifier.h"
#include "adm/ADMSubElements.h"
#include "adm/ADMText.h"

using platform::XMLAttributes;

std::unique_ptr<ADMAudioContent> ADMAudioContent::audioContentWithAttributes(const XMLAttributes& attributes)
{
    return std::make_unique<ADMAudioContent>(attributes);
}

ADMAudioContent::ADMAudioContent(const XMLAttributes& attributes)
    : audioContentID_(ADMGetRequiredAttribute(attributes, "audioContentID"))
{
    ADMRequirePrefix(adm::parseIdentifier(audioContentID_, nullptr, &index_, nullptr), kADMAudioContentPrefix,
                     "audioContent");
    audioContentName_ = ADMGetRequiredAttribute(attributes, "audioContentName");
    if (const auto audioContentLanguage = ADMGetAttribute(attributes, "audioContentLanguage"))
        audioContentLanguage_ = *audioContentLanguage;
}

void ADMAudioContent::setSubElement(std::string_view name, std::string_view value, const XMLAttributes& attributes)
{
    static constexpr adm::SubElement<ADMAudioContent> table[] = {
        {"audioObjectIDRef", &ADMAudioContent::addSubElement_audioObjectIDRef},
        {"audioContentLabel", &ADMAudioContent::addSubElement_audioContentLabel},
        {"dialogue", &ADMAudioContent::addSubElement_dialogue},
    };
    adm::addSubElement(*this, table, name, value, attributes);
}

void ADMAudioContent::addSubElement_audioObjectIDRef(std::string_view value, const XMLAttributes&)
{
    audioObjects_.ids.emplace_back(value);
}

void ADMAudioContent::addSubElement_audioContentLabel(std::string_view value, const XMLAttributes& attributes)
{
    adm::addLabel(audioContentLabels_, value, attributes);
}

void ADMAudioContent::addSubElement_dialogue(std::string_view value, const XMLAttributes& attributes)
{
    dialogueMode_ = adm::integerOf(value);
    nonDialogueContentKind_ = adm::integerOf(*ADMGetAttribute(attributes, "nonDialogueContentKind", "0"));
    dialogueContentKind_ = adm::integerOf(*ADMGetAttribute(attributes, "dialogueContentKind", "0"));
    mixedContentKind_ = adm::integerOf(*ADMGetAttribute(attributes, "mixedContentKind", "0"));
}

void ADMAudioContent::resolveIDRefsWithResolver(ADMElementResolver& resolver)
{
    audioObjects_.resolve(resolver, kADMAudioObjectPrefix);
}

void ADMAudioContent::announceIDRefsToResolver(ADMElementResolver& resolver) const
{
    audioObjects_.announce(resolver, kADMAudioObjectPrefix);
}
