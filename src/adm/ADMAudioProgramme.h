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

/// What is broadcast, made of contents. Its links are owned by the document.
class KT_EXPORT ADMAudioProgramme : public ADMElement {
public:
    /// `audioProgrammeWithAttributes:`. Raises what the constructor raises.
    static std::unique_ptr<ADMAudioProgramme> audioProgrammeWithAttributes(const platform::XMLAttributes& attributes);
    /// Raises MalformedDefinition without an ID or a name, WrongIDPrefix unless the ID begins with APR.
    explicit ADMAudioProgramme(const platform::XMLAttributes& attributes);

    /// APR_xxxx, as written.
    const std::string& audioProgrammeID() const { return audioProgrammeID_; }
    void setAudioProgrammeID(std::string value) { audioProgrammeID_ = std::move(value); }
    /// The four digits of the ID.
    std::uint32_t index() const { return index_; }
    void setIndex(std::uint32_t value) { index_ = value; }
    /// Never empty in a parsed document.
    const std::string& audioProgrammeName() const { return audioProgrammeName_; }
    void setAudioProgrammeName(std::string value) { audioProgrammeName_ = std::move(value); }
    /// A language code as written ("en"); null when it is not given.
    const std::optional<std::string>& audioProgrammeLanguage() const { return audioProgrammeLanguage_; }
    void setAudioProgrammeLanguage(std::optional<std::string> value) { audioProgrammeLanguage_ = std::move(value); }
    /// In microseconds; 0 when it is not given, `kADMInvalidTime` when it cannot be read.
    std::int64_t start() const { return start_; }
    /// start() with a fraction read as decimals, when the document was asked for that; else the same as start().
    std::int64_t exactStart() const { return exactStart_; }
    /// Sets start() and exactStart().
    void setStart(std::int64_t value) { start_ = exactStart_ = value; }
    /// In microseconds; `kADMInvalidTime` when it is not given.
    std::int64_t end() const { return end_; }
    /// end() with a fraction read as decimals, when the document was asked for that; else the same as end().
    std::int64_t exactEnd() const { return exactEnd_; }
    /// Sets end() and exactEnd().
    void setEnd(std::int64_t value) { end_ = exactEnd_ = value; }
    /// How far dialogue may duck the programme, in decibels, 0 or negative; 0 when it is not given.
    std::int32_t maxDuckingDepth() const { return maxDuckingDepth_; }
    void setMaxDuckingDepth(std::int32_t value) { maxDuckingDepth_ = value; }
    /// The IDs of its contents, in document order.
    const std::vector<std::string>& audioContentIDs() const { return audioContents_.ids; }
    void setAudioContentIDs(std::vector<std::string> value) { audioContents_.ids = std::move(value); }
    /// The contents of audioContentIDs(), filled in when the document is complete; null where an ID was let pass.
    const std::vector<ADMAudioContent*>& audioContents() const { return audioContents_.elements; }
    void setAudioContents(std::vector<ADMAudioContent*> value) { audioContents_.elements = std::move(value); }
    /// The labels by language.
    const ADMLabels& audioProgrammeLabels() const { return audioProgrammeLabels_; }
    void setAudioProgrammeLabels(ADMLabels value) { audioProgrammeLabels_ = std::move(value); }

    std::string_view elementName() const override { return "audioProgramme"; }
    std::string elementID() const override { return audioProgrammeID_; }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    /// Appends to audioContentIDs().
    void addSubElement_audioContentIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    /// Adds to audioProgrammeLabels() under the attribute "language"; ignored without one.
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
