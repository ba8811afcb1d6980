#include "adm/ADMAudioBlockFormat.h"

#include "adm/ADMAttributes.h"
#include "adm/ADMAudioBlockFormat_DirectSpeaker.h"
#include "adm/ADMAudioBlockFormat_Object.h"
#include "adm/ADMException.h"
#include "adm/ADMIdentifier.h"
#include "adm/ADMNames.h"
#include "adm/ADMText.h"

#include <cstdio>

using platform::XMLAttributes;

namespace {

/// The ID that most documents write for these numbers.
std::string usualID(ADMType_t type, std::uint32_t index, std::uint32_t blockIndex)
{
    char text[48];
    std::snprintf(text, sizeof text, "AB_%04X%04X_%08X", type, index, blockIndex);
    return text;
}

/// Whether `usualID` gives back this ID, which has been parsed already.
bool isUsual(std::string_view identifier)
{
    constexpr std::size_t size = std::string_view("AB_yyyyxxxx_zzzzzzzz").size();
    if (identifier.size() != size || !identifier.starts_with(kADMAudioBlockPrefix))
        return false;
    for (const char c : identifier)
        if (c >= 'a' && c <= 'z')
            return false;
    return true;
}

} // namespace

std::unique_ptr<ADMAudioBlockFormat>
ADMAudioBlockFormat::audioBlockFormatWithAttributes(const XMLAttributes& attributes)
{
    const Identity identity = identityOf(attributes);
    if (identity.type == kADMTypeObjects)
        return std::make_unique<ADMAudioBlockFormat_Object>(identity, attributes);
    if (identity.type == kADMTypeDirectSpeakers)
        return std::make_unique<ADMAudioBlockFormat_DirectSpeaker>(identity, attributes);
    throw ADMException(kADMExceptionUnsupportedDefinition,
                       "type '" + std::to_string(identity.type) + "' not supported for audioBlockFormat");
}

ADMAudioBlockFormat::Identity ADMAudioBlockFormat::identityOf(const XMLAttributes& attributes)
{
    Identity identity;
    identity.text = ADMGetRequiredAttribute(attributes, "audioBlockFormatID");
    const std::string_view prefix =
        adm::parseIdentifier(identity.text, &identity.type, &identity.index, &identity.blockIndex);
    ADMRequirePrefix(prefix, kADMAudioBlockPrefix, "audioBlockFormat");
    return identity;
}

ADMAudioBlockFormat::ADMAudioBlockFormat(const XMLAttributes& attributes)
    : ADMAudioBlockFormat(identityOf(attributes), attributes)
{
}

ADMAudioBlockFormat::ADMAudioBlockFormat(const Identity& identity, const XMLAttributes& attributes)
    : type_(identity.type),
      index_(identity.index),
      blockIndex_(identity.blockIndex)
{
    if (!isUsual(identity.text))
        unusualID_ = std::make_unique<std::string>(identity.text);
    if (const auto rtime = adm::attribute(attributes, "rtime"))
        setRtime(ADMTimestampStringToMicroSeconds(rtime));
    setDuration(ADMTimestampStringToMicroSeconds(adm::attribute(attributes, "duration")));
}

ADMAudioBlockFormat::~ADMAudioBlockFormat() = default;

std::string ADMAudioBlockFormat::audioBlockFormatID() const
{
    return unusualID_ != nullptr ? *unusualID_ : usualID(type_, index_, blockIndex_);
}

void ADMAudioBlockFormat::setAudioBlockFormatID(std::string_view value)
{
    unusualID_ = std::make_unique<std::string>(value);
}

/// Stores the ID in force before one of the numbers that it is made from changes.
void ADMAudioBlockFormat::keepID()
{
    if (unusualID_ == nullptr)
        setAudioBlockFormatID(audioBlockFormatID());
}

void ADMAudioBlockFormat::setType(ADMType_t value)
{
    keepID();
    type_ = value;
}

void ADMAudioBlockFormat::setIndex(std::uint32_t value)
{
    keepID();
    index_ = value;
}

void ADMAudioBlockFormat::setBlockIndex(std::uint32_t value)
{
    keepID();
    blockIndex_ = value;
}

void ADMAudioBlockFormat::validate() const
{
}

void ADMAudioBlockFormat::setSubElement(std::string_view name, std::string_view value, const XMLAttributes& attributes)
{
    if (adm::is(name, "gain")) {
        gainUnit_ = adm::gainUnitOf(adm::attribute(attributes, "gainUnit").value_or("linear"));
        gain_ = adm::floatOf(value);
        hasGain_ = true;
    } else if (adm::is(name, "importance")) {
        importance_ = adm::floatOf(value);
    } else if (adm::is(name, "headLocked")) {
        headLocked_ = adm::booleanOf(value);
    } else if (adm::is(name, "headphoneVirtualize")) {
        headphoneVirtualize_ = adm::booleanOf(value);
    }
}

void ADMAudioBlockFormat::readExactTimes(const XMLAttributes& attributes)
{
    if (const auto rtime = adm::attribute(attributes, "rtime"))
        exactRtime_ = ADMTimestampStringToExactMicroSeconds(rtime);
    exactDuration_ = ADMTimestampStringToExactMicroSeconds(adm::attribute(attributes, "duration"));
}

std::string ADMAudioBlockFormat::commonDescription() const
{
    return "ID = " + audioBlockFormatID() + ", rtime = " + ADMTimeMicrosecToTimestampString(rtime_) +
           ", duration = " + ADMTimeMicrosecToTimestampString(duration_) + ", gain = " + adm::fixedText(gain_) +
           ", importance = " + adm::fixedText(importance_) + ", headlocked = " + adm::booleanText(headLocked_) +
           ", headphoneVirtualize = " + adm::booleanText(headphoneVirtualize_);
}

std::string ADMAudioBlockFormat::description() const
{
    return "<ADMAudioBlockFormat: " + commonDescription() + ">";
}
