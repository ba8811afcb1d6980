// An object: tracks, and how they are to be understood, over a stretch of time. Times are microseconds.
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

struct ADMPolarOffset {
    float azimuth = 0;
    float elevation = 0;
    float distance = 0;
    friend bool operator==(const ADMPolarOffset&, const ADMPolarOffset&) = default;
};

struct ADMCartesianOffset {
    float X = 0;
    float Y = 0;
    float Z = 0;
    friend bool operator==(const ADMCartesianOffset&, const ADMCartesianOffset&) = default;
};

class KT_EXPORT ADMAudioObject : public ADMElement {
public:
    /// `audioObjectWithAttributes:`
    static std::unique_ptr<ADMAudioObject> audioObjectWithAttributes(const platform::XMLAttributes& attributes);
    explicit ADMAudioObject(const platform::XMLAttributes& attributes);

    const std::string& audioObjectID() const { return audioObjectID_; }
    void setAudioObjectID(std::string value) { audioObjectID_ = std::move(value); }
    const std::string& audioObjectName() const { return audioObjectName_; }
    void setAudioObjectName(std::string value) { audioObjectName_ = std::move(value); }
    std::int64_t start() const { return start_; }
    std::int64_t exactStart() const { return exactStart_; }
    void setStart(std::int64_t value) { start_ = exactStart_ = value; }
    std::int64_t duration() const { return duration_; }
    std::int64_t exactDuration() const { return exactDuration_; }
    void setDuration(std::int64_t value) { duration_ = exactDuration_ = value; }
    std::int64_t dialogueMode() const { return dialogueMode_; }
    void setDialogueMode(std::int64_t value) { dialogueMode_ = value; }
    std::int64_t importance() const { return importance_; }
    void setImportance(std::int64_t value) { importance_ = value; }
    bool interact() const { return interact_; }
    void setInteract(bool value) { interact_ = value; }
    /// The attribute "disableDucking".
    bool disallowDucking() const { return disallowDucking_; }
    void setDisallowDucking(bool value) { disallowDucking_ = value; }
    const std::vector<std::string>& audioPackFormatIDRefs() const { return audioPackFormats_.ids; }
    void setAudioPackFormatIDRefs(std::vector<std::string> value) { audioPackFormats_.ids = std::move(value); }
    const std::vector<ADMAudioPackFormat*>& audioPackFormats() const { return audioPackFormats_.elements; }
    void setAudioPackFormats(std::vector<ADMAudioPackFormat*> value) { audioPackFormats_.elements = std::move(value); }
    const std::vector<std::string>& audioObjectIDRefs() const { return audioObjects_.ids; }
    void setAudioObjectIDRefs(std::vector<std::string> value) { audioObjects_.ids = std::move(value); }
    const std::vector<ADMAudioObject*>& audioObjects() const { return audioObjects_.elements; }
    void setAudioObjects(std::vector<ADMAudioObject*> value) { audioObjects_.elements = std::move(value); }
    const std::vector<std::string>& audioTrackUIDRefs() const { return audioTrackUIDs_.ids; }
    void setAudioTrackUIDRefs(std::vector<std::string> value) { audioTrackUIDs_.ids = std::move(value); }
    const std::vector<ADMAudioTrackUID*>& audioTrackUIDs() const { return audioTrackUIDs_.elements; }
    void setAudioTrackUIDs(std::vector<ADMAudioTrackUID*> value) { audioTrackUIDs_.elements = std::move(value); }
    const ADMLabels& audioObjectLabels() const { return audioObjectLabels_; }
    void setAudioObjectLabels(ADMLabels value) { audioObjectLabels_ = std::move(value); }
    /// As written; `gainUnit` tells how to take it.
    float gain() const { return gain_; }
    void setGain(float value) { gain_ = value; }
    /// 1 for decibels, 0 for linear.
    int gainUnit() const { return gainUnit_; }
    void setGainUnit(int value) { gainUnit_ = value; }
    bool headLocked() const { return headLocked_; }
    void setHeadLocked(bool value) { headLocked_ = value; }
    bool mute() const { return mute_; }
    void setMute(bool value) { mute_ = value; }
    ADMPolarOffset polarOffset() const { return polarOffset_; }
    void setPolarOffset(ADMPolarOffset value) { polarOffset_ = value; }
    ADMCartesianOffset cartesianOffset() const { return cartesianOffset_; }
    void setCartesianOffset(ADMCartesianOffset value) { cartesianOffset_ = value; }

    std::string_view elementName() const override { return "audioObject"; }
    std::string elementID() const override { return audioObjectID_; }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    void addSubElement_audioPackFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    void addSubElement_audioObjectIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    void addSubElement_audioTrackUIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    void addSubElement_audioObjectLabel(std::string_view value, const platform::XMLAttributes& attributes);
    void addSubElement_gain(std::string_view value, const platform::XMLAttributes& attributes);
    void addSubElement_headLocked(std::string_view value, const platform::XMLAttributes& attributes);
    void addSubElement_mute(std::string_view value, const platform::XMLAttributes& attributes);
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
