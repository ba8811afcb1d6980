// A block: one slice of a channel format in time. What kind it is, its own ID decides. Times are microseconds. There
// may be millions of blocks, so that they are kept small.
#pragma once

#include "adm/ADMElement.h"
#include "adm/ADMPosition.h"
#include "adm/ADMTimestamp.h"
#include "adm/ADMTypes.h"

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

class KT_EXPORT ADMAudioBlockFormat : public ADMElement {
public:
    /// `audioBlockFormatWithAttributes:`: a block of the kind that its ID says. Raises WrongIDPrefix, and
    /// UnsupportedDefinition for other kinds than DirectSpeakers and Objects.
    static std::unique_ptr<ADMAudioBlockFormat>
    audioBlockFormatWithAttributes(const platform::XMLAttributes& attributes);
    explicit ADMAudioBlockFormat(const platform::XMLAttributes& attributes);
    ~ADMAudioBlockFormat() override;

    std::string audioBlockFormatID() const;
    /// Changes neither the type nor the indices, nor do they change it.
    void setAudioBlockFormatID(std::string_view value);
    ADMType_t type() const { return type_; }
    void setType(ADMType_t value);
    std::uint32_t index() const { return index_; }
    void setIndex(std::uint32_t value);
    std::uint32_t blockIndex() const { return blockIndex_; }
    void setBlockIndex(std::uint32_t value);
    std::int64_t rtime() const { return rtime_; }
    std::int64_t exactRtime() const { return exactRtime_; }
    void setRtime(std::int64_t value) { rtime_ = exactRtime_ = value; }
    /// `kADMInvalidTime` when it is not given: the block lasts as long as its object.
    std::int64_t duration() const { return duration_; }
    std::int64_t exactDuration() const { return exactDuration_; }
    void setDuration(std::int64_t value) { duration_ = exactDuration_ = value; }
    bool hasGain() const { return hasGain_; }
    void setHasGain(bool value) { hasGain_ = value; }
    /// As written; `gainUnit` tells how to take it.
    float gain() const { return gain_; }
    void setGain(float value) { gain_ = value; }
    /// 1 for decibels, 0 for linear.
    int gainUnit() const { return gainUnit_; }
    void setGainUnit(int value) { gainUnit_ = value; }
    float importance() const { return importance_; }
    void setImportance(float value) { importance_ = value; }
    bool headLocked() const { return headLocked_; }
    void setHeadLocked(bool value) { headLocked_ = value; }
    bool headphoneVirtualize() const { return headphoneVirtualize_; }
    void setHeadphoneVirtualize(bool value) { headphoneVirtualize_ = value; }

    /// Called when the element is complete; raises MalformedDefinition when something that its kind needs is missing.
    virtual void validate() const;

    std::string_view elementName() const override { return "audioBlockFormat"; }
    std::string elementID() const override { return audioBlockFormatID(); }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    void readExactTimes(const platform::XMLAttributes& attributes) override;
    std::string description() const override;
    /// What the descriptions of all kinds begin with.
    std::string commonDescription() const;

protected:
    /// What the ID says.
    struct Identity {
        std::string_view text;
        ADMType_t type = 0;
        std::uint32_t index = 0;
        std::uint32_t blockIndex = 0;
    };
    static Identity identityOf(const platform::XMLAttributes& attributes);
    ADMAudioBlockFormat(const Identity& identity, const platform::XMLAttributes& attributes);

private:
    void keepID();

    std::unique_ptr<std::string> unusualID_; // null: the ID is the one that `type_` and the indices give
    std::int64_t rtime_ = 0;
    std::int64_t exactRtime_ = 0;
    std::int64_t duration_ = kADMInvalidTime;
    std::int64_t exactDuration_ = kADMInvalidTime;
    ADMType_t type_ = 0;
    std::uint32_t index_ = 0;
    std::uint32_t blockIndex_ = 0;
    float gain_ = 1;
    float importance_ = 1;
    int gainUnit_ = 0;
    bool hasGain_ = false;
    bool headLocked_ = false;
    bool headphoneVirtualize_ = false;
};
