// A channel format: one channel, and what it is over time, in blocks. It owns its blocks.
#pragma once

#include "adm/ADMAudioBlockFormat.h"
#include "adm/ADMElement.h"
#include "adm/ADMTypes.h"

#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

class KT_EXPORT ADMAudioChannelFormat : public ADMElement {
public:
    using Blocks = std::vector<std::unique_ptr<ADMAudioBlockFormat>>;

    /// `audioChannelFormatWithAttributes:`
    static std::unique_ptr<ADMAudioChannelFormat>
    audioChannelFormatWithAttributes(const platform::XMLAttributes& attributes);
    explicit ADMAudioChannelFormat(const platform::XMLAttributes& attributes);

    const std::string& audioChannelFormatID() const { return audioChannelFormatID_; }
    void setAudioChannelFormatID(std::string value) { audioChannelFormatID_ = std::move(value); }
    const std::string& audioChannelFormatName() const { return audioChannelFormatName_; }
    void setAudioChannelFormatName(std::string value) { audioChannelFormatName_ = std::move(value); }
    ADMType_t type() const { return type_; }
    void setType(ADMType_t value) { type_ = value; }
    /// In document order.
    const Blocks& audioBlockFormat() const { return audioBlockFormat_; }
    void setAudioBlockFormat(Blocks value) { audioBlockFormat_ = std::move(value); }
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
