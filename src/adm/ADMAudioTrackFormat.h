// A track format: how the samples of one track are coded.
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

class ADMAudioStreamFormat;

/// How the samples of one track are coded. Its link is owned by the document.
class KT_EXPORT ADMAudioTrackFormat : public ADMElement {
public:
    /// `audioTrackFormatWithAttributes:`. Raises what the constructor raises.
    static std::unique_ptr<ADMAudioTrackFormat>
    audioTrackFormatWithAttributes(const platform::XMLAttributes& attributes);
    /// Raises MalformedDefinition without an ID or a name.
    explicit ADMAudioTrackFormat(const platform::XMLAttributes& attributes);

    /// AT_yyyyxxxx_zz, as written.
    const std::string& audioTrackFormatID() const { return audioTrackFormatID_; }
    void setAudioTrackFormatID(std::string value) { audioTrackFormatID_ = std::move(value); }
    /// Never empty in a parsed document.
    const std::string& audioTrackFormatName() const { return audioTrackFormatName_; }
    void setAudioTrackFormatName(std::string value) { audioTrackFormatName_ = std::move(value); }
    /// Hexadecimal, as written ("0001"); null when it is not given.
    const std::optional<std::string>& formatLabel() const { return formatLabel_; }
    void setFormatLabel(std::optional<std::string> value) { formatLabel_ = std::move(value); }
    /// The name of the format, as written ("PCM"); null when it is not given.
    const std::optional<std::string>& formatDefinition() const { return formatDefinition_; }
    void setFormatDefinition(std::optional<std::string> value) { formatDefinition_ = std::move(value); }
    /// The ID of its stream format; null when it is not given.
    const std::optional<std::string>& audioStreamFormatRefID() const { return audioStreamFormat_.id; }
    void setAudioStreamFormatRefID(std::optional<std::string> value) { audioStreamFormat_.id = std::move(value); }
    /// The stream format of audioStreamFormatRefID(), filled in when the document is complete; null for none.
    ADMAudioStreamFormat* audioStreamFormat() const { return audioStreamFormat_.element; }
    void setAudioStreamFormat(ADMAudioStreamFormat* value) { audioStreamFormat_.element = value; }
    /// Never filled from a document.
    const std::vector<std::string>& formatIDRefs() const { return formatIDRefs_; }
    void setFormatIDRefs(std::vector<std::string> value) { formatIDRefs_ = std::move(value); }

    std::string_view elementName() const override { return "audioTrackFormat"; }
    std::string elementID() const override { return audioTrackFormatID_; }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    /// Sets audioStreamFormatRefID(). Raises MalformedDefinition for a second one that differs.
    void addSubElement_audioStreamFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    void resolveIDRefsWithResolver(ADMElementResolver& resolver) override;
    void announceIDRefsToResolver(ADMElementResolver& resolver) const override;

private:
    std::string audioTrackFormatID_;
    std::string audioTrackFormatName_;
    std::optional<std::string> formatLabel_;
    std::optional<std::string> formatDefinition_;
    ADMReference<ADMAudioStreamFormat> audioStreamFormat_;
    std::vector<std::string> formatIDRefs_;
};
