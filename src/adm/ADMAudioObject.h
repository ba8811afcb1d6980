// An object: tracks, and how to take them over a stretch of time. Times are microseconds.
#pragma once

#include "adm/ADMElement.h"
#include "adm/ADMLabels.h"
#include "adm/ADMReferences.h"
#include "adm/ADMTimestamp.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

class ADMAudioPackFormat;
class ADMAudioTrackUID;

/// A shift of polar positions. Coordinates that are not given are 0.
struct ADMPolarOffset {
    float azimuth = 0;   // degrees
    float elevation = 0; // degrees
    float distance = 0;  // normalised
    friend bool operator==(const ADMPolarOffset&, const ADMPolarOffset&) = default;
};

/// A shift of cartesian positions, in their normalised unit. Coordinates that are not given are 0.
struct ADMCartesianOffset {
    float X = 0; // to the right
    float Y = 0; // to the front
    float Z = 0; // upwards
    friend bool operator==(const ADMCartesianOffset&, const ADMCartesianOffset&) = default;
};

/// Tracks, and how to take them over a stretch of time. Its links are owned by the document.
class KT_EXPORT ADMAudioObject : public ADMElement {
public:
    /// `audioObjectWithAttributes:`. Raises what the constructor raises.
    static std::unique_ptr<ADMAudioObject> audioObjectWithAttributes(const platform::XMLAttributes& attributes);
    /// Raises MalformedDefinition without an ID or a name; the form of the ID is not checked.
    explicit ADMAudioObject(const platform::XMLAttributes& attributes);

    /// AO_xxxx, as written.
    const std::string& audioObjectID() const { return audioObjectID_; }
    void setAudioObjectID(std::string value) { audioObjectID_ = std::move(value); }
    /// Never empty in a parsed document.
    const std::string& audioObjectName() const { return audioObjectName_; }
    void setAudioObjectName(std::string value) { audioObjectName_ = std::move(value); }
    /// In microseconds from the start of the programme; 0 when it is not given, `kADMInvalidTime` when it cannot be
    /// read.
    std::int64_t start() const { return start_; }
    /// start() with a fraction read as decimals, when the document was asked for that; else the same as start().
    std::int64_t exactStart() const { return exactStart_; }
    /// Sets start() and exactStart().
    void setStart(std::int64_t value) { start_ = exactStart_ = value; }
    /// In microseconds; `kADMInvalidTime` when it is not given: the object lasts as long as the programme.
    std::int64_t duration() const { return duration_; }
    /// duration() with a fraction read as decimals, when the document was asked for that; else the same as
    /// duration().
    std::int64_t exactDuration() const { return exactDuration_; }
    /// Sets duration() and exactDuration().
    void setDuration(std::int64_t value) { duration_ = exactDuration_ = value; }
    /// 0 without dialogue, 1 with, 2 mixed, as written, unchecked; 2 when it is not given.
    std::int64_t dialogueMode() const { return dialogueMode_; }
    void setDialogueMode(std::int64_t value) { dialogueMode_ = value; }
    /// 0 to 10 in the standard, not checked; 10 when it is not given.
    std::int64_t importance() const { return importance_; }
    void setImportance(std::int64_t value) { importance_ = value; }
    /// Whether a listener may change the object.
    bool interact() const { return interact_; }
    void setInteract(bool value) { interact_ = value; }
    /// Whether the object is never ducked: the attribute "disableDucking".
    bool disallowDucking() const { return disallowDucking_; }
    void setDisallowDucking(bool value) { disallowDucking_ = value; }
    /// The IDs of its pack formats, in document order.
    const std::vector<std::string>& audioPackFormatIDRefs() const { return audioPackFormats_.ids; }
    void setAudioPackFormatIDRefs(std::vector<std::string> value) { audioPackFormats_.ids = std::move(value); }
    /// The pack formats of audioPackFormatIDRefs(), filled in when the document is complete; null where an ID was let
    /// pass.
    const std::vector<ADMAudioPackFormat*>& audioPackFormats() const { return audioPackFormats_.elements; }
    void setAudioPackFormats(std::vector<ADMAudioPackFormat*> value) { audioPackFormats_.elements = std::move(value); }
    /// The IDs of the objects in it, in document order.
    const std::vector<std::string>& audioObjectIDRefs() const { return audioObjects_.ids; }
    void setAudioObjectIDRefs(std::vector<std::string> value) { audioObjects_.ids = std::move(value); }
    /// The objects of audioObjectIDRefs(), filled in when the document is complete; null where an ID was let pass.
    const std::vector<ADMAudioObject*>& audioObjects() const { return audioObjects_.elements; }
    void setAudioObjects(std::vector<ADMAudioObject*> value) { audioObjects_.elements = std::move(value); }
    /// The IDs of its tracks, in document order.
    const std::vector<std::string>& audioTrackUIDRefs() const { return audioTrackUIDs_.ids; }
    void setAudioTrackUIDRefs(std::vector<std::string> value) { audioTrackUIDs_.ids = std::move(value); }
    /// The tracks of audioTrackUIDRefs(), filled in when the document is complete; null where an ID was let pass.
    const std::vector<ADMAudioTrackUID*>& audioTrackUIDs() const { return audioTrackUIDs_.elements; }
    void setAudioTrackUIDs(std::vector<ADMAudioTrackUID*> value) { audioTrackUIDs_.elements = std::move(value); }
    /// The labels by language.
    const ADMLabels& audioObjectLabels() const { return audioObjectLabels_; }
    void setAudioObjectLabels(ADMLabels value) { audioObjectLabels_ = std::move(value); }
    /// The gain as written, in the unit that gainUnit() names; 1 when it is not given.
    float gain() const { return gain_; }
    void setGain(float value) { gain_ = value; }
    /// 1 for decibels, 0 for linear.
    int gainUnit() const { return gainUnit_; }
    void setGainUnit(int value) { gainUnit_ = value; }
    /// Whether positions move with the listener's head.
    bool headLocked() const { return headLocked_; }
    void setHeadLocked(bool value) { headLocked_ = value; }
    /// Whether the object is silent.
    bool mute() const { return mute_; }
    void setMute(bool value) { mute_ = value; }
    /// The shift of its blocks' polar positions.
    ADMPolarOffset polarOffset() const { return polarOffset_; }
    void setPolarOffset(ADMPolarOffset value) { polarOffset_ = value; }
    /// The shift of its blocks' cartesian positions.
    ADMCartesianOffset cartesianOffset() const { return cartesianOffset_; }
    void setCartesianOffset(ADMCartesianOffset value) { cartesianOffset_ = value; }

    std::string_view elementName() const override { return "audioObject"; }
    std::string elementID() const override { return audioObjectID_; }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    /// Appends to audioPackFormatIDRefs().
    void addSubElement_audioPackFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    /// Appends to audioObjectIDRefs().
    void addSubElement_audioObjectIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    /// Appends to audioTrackUIDRefs().
    void addSubElement_audioTrackUIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    /// Adds to audioObjectLabels() under the attribute "language"; ignored without one.
    void addSubElement_audioObjectLabel(std::string_view value, const platform::XMLAttributes& attributes);
    /// Sets gain() and, from the attribute, gainUnit().
    void addSubElement_gain(std::string_view value, const platform::XMLAttributes& attributes);
    /// Sets headLocked().
    void addSubElement_headLocked(std::string_view value, const platform::XMLAttributes& attributes);
    /// Sets mute().
    void addSubElement_mute(std::string_view value, const platform::XMLAttributes& attributes);
    /// Sets one coordinate of polarOffset() or cartesianOffset(), which the attribute "coordinate" names; ignored
    /// when it names none.
    void addSubElement_positionOffset(std::string_view value, const platform::XMLAttributes& attributes);
    void resolveIDRefsWithResolver(ADMElementResolver& resolver) override;
    void announceIDRefsToResolver(ADMElementResolver& resolver) const override;
    void readExactTimes(const platform::XMLAttributes& attributes) override;
    std::string description() const override;

private:
    std::string audioObjectID_;
    std::string audioObjectName_;
    std::int64_t start_ = 0;
    std::int64_t exactStart_ = 0;
    std::int64_t duration_ = kADMInvalidTime;
    std::int64_t exactDuration_ = kADMInvalidTime;
    std::int64_t dialogueMode_ = 2;
    std::int64_t importance_ = 10;
    bool interact_ = false;
    bool disallowDucking_ = false;
    ADMReferenceList<ADMAudioPackFormat> audioPackFormats_;
    ADMReferenceList<ADMAudioObject> audioObjects_;
    ADMReferenceList<ADMAudioTrackUID> audioTrackUIDs_;
    ADMLabels audioObjectLabels_;
    float gain_ = 1;
    int gainUnit_ = 0;
    bool headLocked_ = false;
    bool mute_ = false;
    ADMPolarOffset polarOffset_ = {};
    ADMCartesianOffset cartesianOffset_ = {};
};
