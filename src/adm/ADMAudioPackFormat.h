// A pack format: channel formats that belong together, such as the loudspeakers of a bed.
#pragma once

#include "adm/ADMElement.h"
#include "adm/ADMReferences.h"
#include "adm/ADMTypes.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

class ADMAudioChannelFormat;

/// Channel formats that belong together. Its links are owned by the document.
class KT_EXPORT ADMAudioPackFormat : public ADMElement {
public:
    /// `audioPackFormatWithAttributes:`. Raises what the constructor raises.
    static std::unique_ptr<ADMAudioPackFormat> audioPackFormatWithAttributes(const platform::XMLAttributes& attributes);
    /// Raises MalformedDefinition without an ID, a name, or a type given as label or definition.
    explicit ADMAudioPackFormat(const platform::XMLAttributes& attributes);

    /// AP_yyyyxxxx, as written.
    const std::string& audioPackFormatID() const { return audioPackFormatID_; }
    void setAudioPackFormatID(std::string value) { audioPackFormatID_ = std::move(value); }
    /// Never empty in a parsed document.
    const std::string& audioPackFormatName() const { return audioPackFormatName_; }
    void setAudioPackFormatName(std::string value) { audioPackFormatName_ = std::move(value); }
    /// What its channels are: 1 DirectSpeakers, 3 Objects, and others (ADMTypes.h).
    ADMType_t type() const { return type_; }
    void setType(ADMType_t value) { type_ = value; }
    /// 0 to 10 in the standard, not checked; 10 when it is not given.
    std::uint64_t importance() const { return importance_; }
    void setImportance(std::uint64_t value) { importance_ = value; }
    /// The radius in metres that a normalised distance of 1 stands for; 0 when it is not given.
    float absoluteDistance() const { return absoluteDistance_; }
    void setAbsoluteDistance(float value) { absoluteDistance_ = value; }
    /// The IDs of its channel formats, in document order.
    const std::vector<std::string>& audioChannelFormatIDRefs() const { return audioChannelFormats_.ids; }
    void setAudioChannelFormatIDRefs(std::vector<std::string> value) { audioChannelFormats_.ids = std::move(value); }
    /// The channel formats of audioChannelFormatIDRefs(), filled in when the document is complete; null where an ID
    /// was let pass.
    const std::vector<ADMAudioChannelFormat*>& audioChannelFormats() const { return audioChannelFormats_.elements; }
    void setAudioChannelFormats(std::vector<ADMAudioChannelFormat*> value)
    {
        audioChannelFormats_.elements = std::move(value);
    }
    /// The IDs of the pack formats in it, in document order.
    const std::vector<std::string>& audioPackFormatIDRefs() const { return audioPackFormats_.ids; }
    void setAudioPackFormatIDRefs(std::vector<std::string> value) { audioPackFormats_.ids = std::move(value); }
    /// The pack formats of audioPackFormatIDRefs(), filled in when the document is complete; null where an ID was let
    /// pass.
    const std::vector<ADMAudioPackFormat*>& audioPackFormats() const { return audioPackFormats_.elements; }
    void setAudioPackFormats(std::vector<ADMAudioPackFormat*> value) { audioPackFormats_.elements = std::move(value); }

    std::string_view elementName() const override { return "audioPackFormat"; }
    std::string elementID() const override { return audioPackFormatID_; }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    /// Sets absoluteDistance().
    void addSubElement_absoluteDistance(std::string_view value, const platform::XMLAttributes& attributes);
    /// Appends to audioChannelFormatIDRefs().
    void addSubElement_audioChannelFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    /// Appends to audioPackFormatIDRefs().
    void addSubElement_audioPackFormatIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    void resolveIDRefsWithResolver(ADMElementResolver& resolver) override;
    void announceIDRefsToResolver(ADMElementResolver& resolver) const override;
    std::string description() const override;

private:
    std::string audioPackFormatID_;
    std::string audioPackFormatName_;
    ADMType_t type_ = 0;
    std::uint64_t importance_ = 10;
    float absoluteDistance_ = 0;
    ADMReferenceList<ADMAudioChannelFormat> audioChannelFormats_;
    ADMReferenceList<ADMAudioPackFormat> audioPackFormats_;
};
