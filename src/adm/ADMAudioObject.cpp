#include "adm/ADMAudioObject.h"

#include "adm/ADMAttributes.h"
#include "adm/ADMAudioPackFormat.h"
#include "adm/ADMAudioTrackUID.h"
#include "adm/ADMIdentifier.h"
#include "adm/ADMSubElements.h"
#include "adm/ADMText.h"

using platform::XMLAttributes;

std::unique_ptr<ADMAudioObject> ADMAudioObject::audioObjectWithAttributes(const XMLAttributes& attributes)
{
    return std::make_unique<ADMAudioObject>(attributes);
}

ADMAudioObject::ADMAudioObject(const XMLAttributes& attributes)
    : audioObjectID_(ADMGetRequiredAttribute(attributes, "audioObjectID")),
      audioObjectName_(ADMGetRequiredAttribute(attributes, "audioObjectName"))
{
    if (const auto start = ADMGetAttribute(attributes, "start"))
        setStart(ADMTimestampStringToMicroSeconds(start));
    setDuration(ADMTimestampStringToMicroSeconds(ADMGetAttribute(attributes, "duration")));
    dialogueMode_ = adm::integerOf(*ADMGetAttribute(attributes, "dialogue", "2"));
    importance_ = adm::integerOf(*ADMGetAttribute(attributes, "importance", "10"));
    interact_ = adm::booleanOf(*ADMGetAttribute(attributes, "interact", "0"));
    // Kept: the property and the attribute are named differently.
    disallowDucking_ = adm::booleanOf(*ADMGetAttribute(attributes, "disableDucking", "0"));
}

void ADMAudioObject::readExactTimes(const XMLAttributes& attributes)
{
    if (const auto start = ADMGetAttribute(attributes, "start"))
        exactStart_ = ADMTimestampStringToExactMicroSeconds(start);
    exactDuration_ = ADMTimestampStringToExactMicroSeconds(ADMGetAttribute(attributes, "duration"));
}

void ADMAudioObject::setSubElement(std::string_view name, std::string_view value, const XMLAttributes& attributes)
{
    static constexpr adm::SubElement<ADMAudioObject> table[] = {
        {"audioPackFormatIDRef", &ADMAudioObject::addSubElement_audioPackFormatIDRef},
        {"audioObjectIDRef", &ADMAudioObject::addSubElement_audioObjectIDRef},
        {"audioTrackUIDRef", &ADMAudioObject::addSubElement_audioTrackUIDRef},
        {"audioObjectLabel", &ADMAudioObject::addSubElement_audioObjectLabel},
        {"gain", &ADMAudioObject::addSubElement_gain},
        {"headLocked", &ADMAudioObject::addSubElement_headLocked},
        {"mute", &ADMAudioObject::addSubElement_mute},
        {"positionOffset", &ADMAudioObject::addSubElement_positionOffset},
    };
    adm::addSubElement(*this, table, name, value, attributes);
}

void ADMAudioObject::addSubElement_audioPackFormatIDRef(std::string_view value, const XMLAttributes&)
{
    audioPackFormats_.ids.emplace_back(value);
}

void ADMAudioObject::addSubElement_audioObjectIDRef(std::string_view value, const XMLAttributes&)
{
    audioObjects_.ids.emplace_back(value);
}

void ADMAudioObject::addSubElement_audioTrackUIDRef(std::string_view value, const XMLAttributes&)
{
    audioTrackUIDs_.ids.emplace_back(value);
}

void ADMAudioObject::addSubElement_audioObjectLabel(std::string_view value, const XMLAttributes& attributes)
{
    adm::addLabel(audioObjectLabels_, value, attributes);
}

void ADMAudioObject::addSubElement_gain(std::string_view value, const XMLAttributes& attributes)
{
    gainUnit_ = adm::gainUnitOf(*ADMGetAttribute(attributes, "gainUnit", "linear"));
    gain_ = adm::floatOf(value);
}

void ADMAudioObject::addSubElement_headLocked(std::string_view value, const XMLAttributes&)
{
    headLocked_ = adm::booleanOf(value);
}

void ADMAudioObject::addSubElement_mute(std::string_view value, const XMLAttributes&)
{
    mute_ = adm::booleanOf(value);
}

void ADMAudioObject::addSubElement_positionOffset(std::string_view value, const XMLAttributes& attributes)
{
    const std::string_view coordinate = ADMGetAttribute(attributes, "coordinate").value_or("");
    const float offset = adm::floatOf(value);
    if (coordinate == "azimuth")
        polarOffset_.azimuth = offset;
    else if (coordinate == "elevation")
        polarOffset_.elevation = offset;
    else if (coordinate == "distance")
        polarOffset_.distance = offset;
    else if (coordinate == "X")
        cartesianOffset_.X = offset;
    else if (coordinate == "Y")
        cartesianOffset_.Y = offset;
    else if (coordinate == "Z")
        cartesianOffset_.Z = offset;
}

void ADMAudioObject::resolveIDRefsWithResolver(ADMElementResolver& resolver)
{
    audioPackFormats_.resolve(resolver, kADMAudioPackFormatPrefix);
    audioObjects_.resolve(resolver, kADMAudioObjectPrefix);
    audioTrackUIDs_.resolve(resolver, kADMAudioTrackUIDPrefix);
}

void ADMAudioObject::announceIDRefsToResolver(ADMElementResolver& resolver) const
{
    audioPackFormats_.announce(resolver, kADMAudioPackFormatPrefix);
    audioObjects_.announce(resolver, kADMAudioObjectPrefix);
    audioTrackUIDs_.announce(resolver, kADMAudioTrackUIDPrefix);
}

std::string ADMAudioObject::description() const
{
    return "<AudioObject: " + adm::addressText(this) + ", ID: " + audioObjectID_ + ", Name: " + audioObjectName_ +
           ", start: " + ADMTimeMicrosecToTimestampString(start_) +
           ", duration: " + ADMTimeMicrosecToTimestampString(duration_) + ", gain = " + adm::shortText(gain_) +
           ", headLocked = " + adm::booleanText(headLocked_) + ", mute = " + adm::booleanText(mute_) +
           "\naudioPackFormats=" + adm::linksText(audioPackFormats()) +
           ", audioObjects=" + adm::linksText(audioObjects()) + ", audioTrackUIDs=" + adm::linksText(audioTrackUIDs()) +
           ">";
}
