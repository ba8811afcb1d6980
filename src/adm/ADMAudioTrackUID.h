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

class KT_EXPORT ADMAudioTrackUID : public ADMElement {
public:
    /// `audioTrackUIDWithAttributes:`
    static std::unique_ptr<ADMAudioTrackUID> audioTrackUIDWithAttributes(const platform::XMLAttributes& attributes);
    explicit ADMAudioTrackUID(const platform::XMLAttributes& attributes);

    const std::string& audioTrackUIDID() const { return audioTrackUIDID_; }
    void setAudioTrackUIDID(std::string value) { audioTrackUIDID_ = std::move(value); }
    std::uint32_t index() const { return index_; }
    void setIndex(std::uint32_t value) { index_ = value; }
    /// In Hz.
    std::int64_t sampleRate() const { return sampleRate_; }
    void setSampleRate(std::int64_t value) { sampleRate_ = value; }
    std::int64_t bitDepth() const { return bitDepth_; }
    void setBitDepth(std::int64_t value) { bitDepth_ = value; }
    const std::optional<std::string>& audioTrackFormatIDRef() const { return audioTrackFormat_.id; }
    void setAudioTrackFormatIDRef(std::optional<std::string> value) { audioTrackFormat_.id = std::move(value); }
    ADMAudioTrackFormat* audioTrackFormat() const { return audioTrackFormat_.element; }
    void setAudioTrackFormat(ADMAudioTrackFormat* value) { audioTrackFormat_.element = value; }
    const std::optional<std::string>& audioChannelFormatIDRef() const { return audioChannelFormat_.id; }
    void setAudioChannelFormatIDRef(std::optional<std::string> value) { audioChannelFormat_.id = std::move(value); }
    ADMAudioChannelFormat* audioChannelFormat() const { return audioChannelFormat_.element; }
    void setAudioChannelFormat(ADMAudioChannelFormat* value) { audioChannelFormat_.element = value; }
    const std::optional<std::string>& audioPackFormatIDRef() const { return audioPackFormat_.id; }
    void setAudioPackFormatIDRef(std::optional<std::string> value) { audioPackFormat_.id = std::move(value); }
    ADMAudioPackFormat* audioPackFormat() const { return audioPackFormat_.element; }
    void setAudioPackFormat(ADMAudioPackFormat* value) { audioPackFormat_.element = value; }

    std::string_view elementName() const override { return "audioTrackUID"; }
    std::string elementID() const override { return audioTrackUIDID_; }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    void addSubElement_audioTrackFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    void addSubElement_audioChannelFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
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
