// A block: one slice of a channel format in time. Its ID decides its kind. Times are microseconds. A document may
// have millions of blocks, so they are kept small.
#pragma once

#include "adm/ADMElement.h"
#include "adm/ADMPosition.h"
#include "adm/ADMTimestamp.h"
#include "adm/ADMTypes.h"

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

/// One slice of a channel format in time; the kinds that have a position derive from it.
class KT_EXPORT ADMAudioBlockFormat : public ADMElement {
public:
    /// `audioBlockFormatWithAttributes:`: a block of the kind that its ID names. Raises WrongIDPrefix, and
    /// UnsupportedDefinition for kinds other than DirectSpeakers and Objects.
    static std::unique_ptr<ADMAudioBlockFormat>
    audioBlockFormatWithAttributes(const platform::XMLAttributes& attributes);
    /// Reads "audioBlockFormatID", "rtime" and "duration". Raises MalformedDefinition without the ID, WrongIDPrefix
    /// unless it begins with AB.
    explicit ADMAudioBlockFormat(const platform::XMLAttributes& attributes);
    ~ADMAudioBlockFormat() override;

    /// The block's own ID, AB_yyyyxxxx_zzzzzzzz.
    std::string audioBlockFormatID() const;
    /// Independent of type() and the indices: neither changes the other.
    void setAudioBlockFormatID(std::string_view value);
    /// The kind of the block, the first four digits of the ID: 1 DirectSpeakers, 3 Objects.
    ADMType_t type() const { return type_; }
    void setType(ADMType_t value);
    /// The number of the channel format, the second four digits of the ID.
    std::uint32_t index() const { return index_; }
    void setIndex(std::uint32_t value);
    /// The number of the block in its channel format, the last eight digits of the ID.
    std::uint32_t blockIndex() const { return blockIndex_; }
    void setBlockIndex(std::uint32_t value);
    /// The start relative to the object's, in microseconds; 0 when it is not given, `kADMInvalidTime` when it cannot
    /// be read.
    std::int64_t rtime() const { return rtime_; }
    /// rtime() with a fraction read as decimals, when the document was asked for that; else the same as rtime().
    std::int64_t exactRtime() const { return exactRtime_; }
    /// Sets rtime() and exactRtime().
    void setRtime(std::int64_t value) { rtime_ = exactRtime_ = value; }
    /// In microseconds; `kADMInvalidTime` when it is not given: the block lasts as long as its object.
    std::int64_t duration() const { return duration_; }
    /// duration() with a fraction read as decimals, when the document was asked for that; else the same as
    /// duration().
    std::int64_t exactDuration() const { return exactDuration_; }
    /// Sets duration() and exactDuration().
    void setDuration(std::int64_t value) { duration_ = exactDuration_ = value; }
    /// Whether the document gives a gain.
    bool hasGain() const { return hasGain_; }
    void setHasGain(bool value) { hasGain_ = value; }
    /// The gain as written, in the unit that gainUnit() names; 1 when it is not given.
    float gain() const { return gain_; }
    void setGain(float value) { gain_ = value; }
    /// 1 for decibels, 0 for linear.
    int gainUnit() const { return gainUnit_; }
    void setGainUnit(int value) { gainUnit_ = value; }
    /// 0 to 10 in the standard, not checked; 1 when it is not given.
    float importance() const { return importance_; }
    void setImportance(float value) { importance_ = value; }
    /// Whether the position moves with the listener's head.
    bool headLocked() const { return headLocked_; }
    void setHeadLocked(bool value) { headLocked_ = value; }
    /// Whether headphones render the block as virtual loudspeakers.
    bool headphoneVirtualize() const { return headphoneVirtualize_; }
    void setHeadphoneVirtualize(bool value) { headphoneVirtualize_ = value; }

    /// Called when the element is complete. Raises MalformedDefinition when something that its kind needs is missing.
    virtual void validate() const;

    std::string_view elementName() const override { return "audioBlockFormat"; }
    std::string elementID() const override { return audioBlockFormatID(); }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    void readExactTimes(const platform::XMLAttributes& attributes) override;
    std::string description() const override;
    /// The fields that the descriptions of all kinds begin with.
    std::string commonDescription() const;

protected:
    /// The parts of a block's ID.
    struct Identity {
        std::string_view text;        // the whole ID, a view of the attributes
        ADMType_t type = 0;           // the kind of the block
        std::uint32_t index = 0;      // the number of the channel format
        std::uint32_t blockIndex = 0; // the number of the block
    };
    /// Splits the attribute "audioBlockFormatID". Raises MalformedDefinition, MalformedIDString and WrongIDPrefix.
    static Identity identityOf(const platform::XMLAttributes& attributes);
    /// For a factory that has split the ID already.
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
