#include "adm/ADMAudioProgramme.h"

#include "adm/ADMAttributes.h"
#include "adm/ADMAudioContent.h"
#include "adm/ADMIdentifier.h"
#include "adm/ADMSubElements.h"
#include "adm/ADMText.h"

using platform::XMLAttributes;

std::unique_ptr<ADMAudioProgramme> ADMAudioProgramme::audioProgrammeWithAttributes(const XMLAttributes& attributes)
{
    return std::make_unique<ADMAudioProgramme>(attributes);
}

ADMAudioProgramme::ADMAudioProgramme(const XMLAttributes& attributes)
    : audioProgrammeID_(ADMGetRequiredAttribute(attributes, "audioProgrammeID"))
{
    ADMRequirePrefix(adm::parseIdentifier(audioProgrammeID_, nullptr, &index_, nullptr), kADMAudioProgrammePrefix,
                     "audioProgramme");
    audioProgrammeName_ = ADMGetRequiredAttribute(attributes, "audioProgrammeName");
    if (const auto audioProgrammeLanguage = ADMGetAttribute(attributes, "audioProgrammeLanguage"))
        audioProgrammeLanguage_ = *audioProgrammeLanguage;
    if (const auto start = ADMGetAttribute(attributes, "start"))
        setStart(ADMTimestampStringToMicroSeconds(start));
    setEnd(ADMTimestampStringToMicroSeconds(ADMGetAttribute(attributes, "end")));
    maxDuckingDepth_ = adm::integer32Of(*ADMGetAttribute(attributes, "maxDuckingDepth", "0"));
}

void ADMAudioProgramme::readExactTimes(const XMLAttributes& attributes)
{
    if (const auto start = ADMGetAttribute(attributes, "start"))
        exactStart_ = ADMTimestampStringToExactMicroSeconds(start);
    exactEnd_ = ADMTimestampStringToExactMicroSeconds(ADMGetAttribute(attributes, "end"));
}

void ADMAudioProgramme::setSubElement(std::string_view name, std::string_view value, const XMLAttributes& attributes)
{
    static constexpr adm::SubElement<ADMAudioProgramme> table[] = {
        {"audioContentIDRef", &ADMAudioProgramme::addSubElement_audioContentIDRef},
        {"audioProgrammeLabel", &ADMAudioProgramme::addSubElement_audioProgrammeLabel},
    };
    adm::addSubElement(*this, table, name, value, attributes);
}

void ADMAudioProgramme::addSubElement_audioContentIDRef(std::string_view value, const XMLAttributes&)
{
    audioContents_.ids.emplace_back(value);
}

void ADMAudioProgramme::addSubElement_audioProgrammeLabel(std::string_view value, const XMLAttributes& attributes)
{
    adm::addLabel(audioProgrammeLabels_, value, attributes);
}

void ADMAudioProgramme::resolveIDRefsWithResolver(ADMElementResolver& resolver)
{
    audioContents_.resolve(resolver, kADMAudioContentPrefix);
}

void ADMAudioProgramme::announceIDRefsToResolver(ADMElementResolver& resolver) const
{
    audioContents_.announce(resolver, kADMAudioContentPrefix);
}
