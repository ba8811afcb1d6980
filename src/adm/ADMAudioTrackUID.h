// A track of a file: its samples, and what they are.
#pragma once

#include "adm/ADMElement.h"
#include "adm/ADMReferences.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

class ADMAudioChannelFormat;
class ADMAudioPackFormat;
class ADMAudioTrackFormat;

/// One track of a file, and what its samples are. Its links are owned by the document.
class KT_EXPORT ADMAudioTrackUID : public ADMElement {
public:
    /// `audioTrackUIDWithAttributes:`. Raises what the constructor raises.
    static std::unique_ptr<ADMAudioTrackUID> audioTrackUIDWithAttributes(const platform::XMLAttributes& attributes);
    /// Raises MalformedDefinition without a UID, WrongIDPrefix unless it begins with ATU.
    explicit ADMAudioTrackUID(const platform::XMLAttributes& attributes);

    /// ATU_xxxxxxxx, as written.
    const std::string& audioTrackUIDID() const { return audioTrackUIDID_; }
    void setAudioTrackUIDID(std::string value) { audioTrackUIDID_ = std::move(value); }
    /// The eight digits of the ID.
    std::uint32_t index() const { return index_; }
    void setIndex(std::uint32_t value) { index_ = value; }
    /// In Hz; 0 when it is not given.
    std::int64_t sampleRate() const { return sampleRate_; }
    void setSampleRate(std::int64_t value) { sampleRate_ = value; }
    /// In bits; 0 when it is not given.
    std::int64_t bitDepth() const { return bitDepth_; }
    void setBitDepth(std::int64_t value) { bitDepth_ = value; }
    /// The ID of the track format; null when it is not given.
    const std::optional<std::string>& audioTrackFormatIDRef() const { return audioTrackFormat_.id; }
    void setAudioTrackFormatIDRef(std::optional<std::string> value) { audioTrackFormat_.id = std::move(value); }
    /// The track format of audioTrackFormatIDRef(), filled in when the document is complete; null for none.
    ADMAudioTrackFormat* audioTrackFormat() const { return audioTrackFormat_.element; }
    void setAudioTrackFormat(ADMAudioTrackFormat* value) { audioTrackFormat_.element = value; }
    /// The ID of the channel format, which stands in place of a track format for PCM; null when it is not given.
    const std::optional<std::string>& audioChannelFormatIDRef() const { return audioChannelFormat_.id; }
    void setAudioChannelFormatIDRef(std::optional<std::string> value) { audioChannelFormat_.id = std::move(value); }
    /// The channel format of audioChannelFormatIDRef(), filled in when the document is complete; null for none.
    ADMAudioChannelFormat* audioChannelFormat() const { return audioChannelFormat_.element; }
    void setAudioChannelFormat(ADMAudioChannelFormat* value) { audioChannelFormat_.element = value; }
    /// The ID of the pack format; null when it is not given.
    const std::optional<std::string>& audioPackFormatIDRef() const { return audioPackFormat_.id; }
    void setAudioPackFormatIDRef(std::optional<std::string> value) { audioPackFormat_.id = std::move(value); }
    /// The pack format of audioPackFormatIDRef(), filled in when the document is complete; null for none.
    ADMAudioPackFormat* audioPackFormat() const { return audioPackFormat_.element; }
    void setAudioPackFormat(ADMAudioPackFormat* value) { audioPackFormat_.element = value; }

    std::string_view elementName() const override { return "audioTrackUID"; }
    std::string elementID() const override { return audioTrackUIDID_; }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    /// Sets audioTrackFormatIDRef(); the last one wins.
    void addSubElement_audioTrackFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    /// Sets audioChannelFormatIDRef(); the last one wins.
    void addSubElement_audioChannelFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    /// Sets audioPackFormatIDRef(); the last one wins.
    void addSubElement_audioPackFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    void resolveIDRefsWithResolver(ADMElementResolver& resolver) override;
    void announceIDRefsToResolver(ADMElementResolver& resolver) const override;
    std::string description() const override;

private:
    std::string audioTrackUIDID_;
    std::uint32_t index_ = 0;
    std::int64_t sampleRate_ = 0;
    std::int64_t bitDepth_ = 0;
    ADMReference<ADMAudioTrackFormat> audioTrackFormat_;
    ADMReference<ADMAudioChannelFormat> audioChannelFormat_;
    ADMReference<ADMAudioPackFormat> audioPackFormat_;
};
