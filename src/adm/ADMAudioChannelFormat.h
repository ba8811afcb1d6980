// A channel format: what one channel is over time, in blocks, which it owns.
#pragma once

#include "adm/ADMAudioBlockFormat.h"
#include "adm/ADMElement.h"
#include "adm/ADMTypes.h"

#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

/// One channel, and what it is over time.
class KT_EXPORT ADMAudioChannelFormat : public ADMElement {
public:
    /// Blocks and their ownership.
    using Blocks = std::vector<std::unique_ptr<ADMAudioBlockFormat>>;

    /// `audioChannelFormatWithAttributes:`. Raises what the constructor raises.
    static std::unique_ptr<ADMAudioChannelFormat>
    audioChannelFormatWithAttributes(const platform::XMLAttributes& attributes);
    /// Raises MalformedDefinition without an ID, a name, or a type given as label or definition.
    explicit ADMAudioChannelFormat(const platform::XMLAttributes& attributes);

    /// AC_yyyyxxxx, as written.
    const std::string& audioChannelFormatID() const { return audioChannelFormatID_; }
    void setAudioChannelFormatID(std::string value) { audioChannelFormatID_ = std::move(value); }
    /// Never empty in a parsed document.
    const std::string& audioChannelFormatName() const { return audioChannelFormatName_; }
    void setAudioChannelFormatName(std::string value) { audioChannelFormatName_ = std::move(value); }
    /// What the channel is: 1 DirectSpeakers, 3 Objects, and others (ADMTypes.h).
    ADMType_t type() const { return type_; }
    void setType(ADMType_t value) { type_ = value; }
    /// The blocks in document order; the channel format owns them.
    const Blocks& audioBlockFormat() const { return audioBlockFormat_; }
    void setAudioBlockFormat(Blocks value) { audioBlockFormat_ = std::move(value); }
    /// Appends a block and takes it over.
    void addAudioBlockFormat(std::unique_ptr<ADMAudioBlockFormat> block);

    std::string_view elementName() const override { return "audioChannelFormat"; }
    std::string elementID() const override { return audioChannelFormatID_; }
    std::string description() const override;

private:
    std::string audioChannelFormatID_;
    std::string audioChannelFormatName_;
    ADMType_t type_ = 0;
    Blocks audioBlockFormat_;
};
