// A programme: what is broadcast, made of contents. Times are microseconds.
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

class ADMAudioContent;

class KT_EXPORT ADMAudioProgramme : public ADMElement {
public:
    /// `audioProgrammeWithAttributes:`
    static std::unique_ptr<ADMAudioProgramme> audioProgrammeWithAttributes(const platform::XMLAttributes& attributes);
    explicit ADMAudioProgramme(const platform::XMLAttributes& attributes);

    const std::string& audioProgrammeID() const { return audioProgrammeID_; }
    void setAudioProgrammeID(std::string value) { audioProgrammeID_ = std::move(value); }
    std::uint32_t index() const { return index_; }
    void setIndex(std::uint32_t value) { index_ = value; }
    const std::string& audioProgrammeName() const { return audioProgrammeName_; }
    void setAudioProgrammeName(std::string value) { audioProgrammeName_ = std::move(value); }
    const std::optional<std::string>& audioProgrammeLanguage() const { return audioProgrammeLanguage_; }
    void setAudioProgrammeLanguage(std::optional<std::string> value) { audioProgrammeLanguage_ = std::move(value); }
    std::int64_t start() const { return start_; }
    std::int64_t exactStart() const { return exactStart_; }
    void setStart(std::int64_t value) { start_ = exactStart_ = value; }
    std::int64_t end() const { return end_; }
    std::int64_t exactEnd() const { return exactEnd_; }
    void setEnd(std::int64_t value) { end_ = exactEnd_ = value; }
    std::int32_t maxDuckingDepth() const { return maxDuckingDepth_; }
    void setMaxDuckingDepth(std::int32_t value) { maxDuckingDepth_ = value; }
    const std::vector<std::string>& audioContentIDs() const { return audioContents_.ids; }
    void setAudioContentIDs(std::vector<std::string> value) { audioContents_.ids = std::move(value); }
    const std::vector<ADMAudioContent*>& audioContents() const { return audioContents_.elements; }
    void setAudioContents(std::vector<ADMAudioContent*> value) { audioContents_.elements = std::move(value); }
    const ADMLabels& audioProgrammeLabels() const { return audioProgrammeLabels_; }
    void setAudioProgrammeLabels(ADMLabels value) { audioProgrammeLabels_ = std::move(value); }

    std::string_view elementName() const override { return "audioProgramme"; }
    std::string elementID() const override { return audioProgrammeID_; }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    void addSubElement_audioContentIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    void addSubElement_audioProgrammeLabel(std::string_view value, const platform::XMLAttributes& attributes);
    void resolveIDRefsWithResolver(ADMElementResolver& resolver) override;
    void announceIDRefsToResolver(ADMElementResolver& resolver) const override;
    void readExactTimes(const platform::XMLAttributes& attributes) override;

private:
    std::string audioProgrammeID_;
    std::uint32_t index_ = 0;
    std::string audioProgrammeName_;
    std::optional<std::string> audioProgrammeLanguage_;
    std::int64_t start_ = 0;
    std::int64_t exactStart_ = 0;
    std::int64_t end_ = kADMInvalidTime;
    std::int64_t exactEnd_ = kADMInvalidTime;
    std::int32_t maxDuckingDepth_ = 0;
    ADMReferenceList<ADMAudioContent> audioContents_;
    ADMLabels audioProgrammeLabels_;
};
