// A stream format: tracks that are decoded together, and what they give.
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

/// Tracks that are decoded together, and the channel or pack that they give. Its links are owned by the document.
class KT_EXPORT ADMAudioStreamFormat : public ADMElement {
public:
    /// `audioStreamFormatWithAttributes:`. Raises what the constructor raises.
    static std::unique_ptr<ADMAudioStreamFormat>
    audioStreamFormatWithAttributes(const platform::XMLAttributes& attributes);
    /// Raises MalformedDefinition without an ID, a name, or a format given as label or definition;
    /// UnsupportedDefinition for formats other than PCM.
    explicit ADMAudioStreamFormat(const platform::XMLAttributes& attributes);

    /// AS_yyyyxxxx, as written.
    const std::string& audioStreamFormatID() const { return audioStreamFormatID_; }
    void setAudioStreamFormatID(std::string value) { audioStreamFormatID_ = std::move(value); }
    /// Never empty in a parsed document.
    const std::string& audioStreamFormatName() const { return audioStreamFormatName_; }
    void setAudioStreamFormatName(std::string value) { audioStreamFormatName_ = std::move(value); }
    /// How samples are coded: 1, PCM, in every parsed document.
    std::uint32_t format() const { return format_; }
    void setFormat(std::uint32_t value) { format_ = value; }
    /// The ID of the channel format that PCM gives; null when it is not given.
    const std::optional<std::string>& audioChannelFormatIDRef() const { return audioChannelFormat_.id; }
    void setAudioChannelFormatIDRef(std::optional<std::string> value) { audioChannelFormat_.id = std::move(value); }
    /// The channel format of audioChannelFormatIDRef(), filled in when the document is complete; null for none.
    ADMAudioChannelFormat* audioChannelFormat() const { return audioChannelFormat_.element; }
    void setAudioChannelFormat(ADMAudioChannelFormat* value) { audioChannelFormat_.element = value; }
    /// The ID of the pack format that the stream gives; null when it is not given.
    const std::optional<std::string>& audioPackFormatIDRef() const { return audioPackFormat_.id; }
    void setAudioPackFormatIDRef(std::optional<std::string> value) { audioPackFormat_.id = std::move(value); }
    /// The pack format of audioPackFormatIDRef(), filled in when the document is complete; null for none.
    ADMAudioPackFormat* audioPackFormat() const { return audioPackFormat_.element; }
    void setAudioPackFormat(ADMAudioPackFormat* value) { audioPackFormat_.element = value; }
    /// The IDs of its track formats, in document order.
    const std::vector<std::string>& audioTrackFormatIDRefs() const { return audioTrackFormats_.ids; }
    void setAudioTrackFormatIDRefs(std::vector<std::string> value) { audioTrackFormats_.ids = std::move(value); }
    /// The track formats of audioTrackFormatIDRefs(), filled in when the document is complete; null where an ID was
    /// let pass.
    const std::vector<ADMAudioTrackFormat*>& audioTrackFormats() const { return audioTrackFormats_.elements; }
    void setAudioTrackFormats(std::vector<ADMAudioTrackFormat*> value)
    {
        audioTrackFormats_.elements = std::move(value);
    }

    std::string_view elementName() const override { return "audioStreamFormat"; }
    std::string elementID() const override { return audioStreamFormatID_; }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    /// Sets audioChannelFormatIDRef(); the last one wins.
    void addSubElement_audioChannelFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    /// Sets audioPackFormatIDRef(); the last one wins.
    void addSubElement_audioPackFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    /// Appends to audioTrackFormatIDRefs().
    void addSubElement_audioTrackFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    void resolveIDRefsWithResolver(ADMElementResolver& resolver) override;
    void announceIDRefsToResolver(ADMElementResolver& resolver) const override;
    std::string description() const override;

private:
    std::string audioStreamFormatID_;
    std::string audioStreamFormatName_;
    std::uint32_t format_ = 0;
    ADMReference<ADMAudioChannelFormat> audioChannelFormat_;
    ADMReference<ADMAudioPackFormat> audioPackFormat_;
    ADMReferenceList<ADMAudioTrackFormat> audioTrackFormats_;
};
