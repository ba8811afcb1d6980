// A content: objects that belong together, and what kind of dialogue they are.
#pragma once

#include "adm/ADMElement.h"
#include "adm/ADMLabels.h"
#include "adm/ADMReferences.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

class ADMAudioObject;

class KT_EXPORT ADMAudioContent : public ADMElement {
public:
    /// `audioContentWithAttributes:`
    static std::unique_ptr<ADMAudioContent> audioContentWithAttributes(const platform::XMLAttributes& attributes);
    explicit ADMAudioContent(const platform::XMLAttributes& attributes);

    const std::string& audioContentID() const { return audioContentID_; }
    void setAudioContentID(std::string value) { audioContentID_ = std::move(value); }
    std::uint32_t index() const { return index_; }
    void setIndex(std::uint32_t value) { index_ = value; }
    const std::string& audioContentName() const { return audioContentName_; }
    void setAudioContentName(std::string value) { audioContentName_ = std::move(value); }
    const std::optional<std::string>& audioContentLanguage() const { return audioContentLanguage_; }
    void setAudioContentLanguage(std::optional<std::string> value) { audioContentLanguage_ = std::move(value); }
    const std::vector<std::string>& audioObjectIDRefs() const { return audioObjects_.ids; }
    void setAudioObjectIDRefs(std::vector<std::string> value) { audioObjects_.ids = std::move(value); }
    const std::vector<ADMAudioObject*>& audioObjects() const { return audioObjects_.elements; }
    void setAudioObjects(std::vector<ADMAudioObject*> value) { audioObjects_.elements = std::move(value); }
    const ADMLabels& audioContentLabels() const { return audioContentLabels_; }
    void setAudioContentLabels(ADMLabels value) { audioContentLabels_ = std::move(value); }
    /// 0 without dialogue, 1 with, 2 mixed, as the document says; 2 when it does not say.
    std::int64_t dialogueMode() const { return dialogueMode_; }
    void setDialogueMode(std::int64_t value) { dialogueMode_ = value; }
    std::int64_t nonDialogueContentKind() const { return nonDialogueContentKind_; }
    void setNonDialogueContentKind(std::int64_t value) { nonDialogueContentKind_ = value; }
    std::int64_t dialogueContentKind() const { return dialogueContentKind_; }
    void setDialogueContentKind(std::int64_t value) { dialogueContentKind_ = value; }
    std::int64_t mixedContentKind() const { return mixedContentKind_; }
    void setMixedContentKind(std::int64_t value) { mixedContentKind_ = value; }

    std::string_view elementName() const override { return "audioContent"; }
    std::string elementID() const override { return audioContentID_; }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    void addSubElement_audioObjectIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    void addSubElement_audioContentLabel(std::string_view value, const platform::XMLAttributes& attributes);
    void addSubElement_dialogue(std::string_view value, const platform::XMLAttributes& attributes);
    void resolveIDRefsWithResolver(ADMElementResolver& resolver) override;
    void announceIDRefsToResolver(ADMElementResolver& resolver) const override;

private:
    std::string audioContentID_;
    std::uint32_t index_ = 0;
    std::string audioContentName_;
    std::optional<std::string> audioContentLanguage_;
    ADMReferenceList<ADMAudioObject> audioObjects_;
    ADMLabels audioContentLabels_;
    std::int64_t dialogueMode_ = 2;
    std::int64_t nonDialogueContentKind_ = 0;
    std::int64_t dialogueContentKind_ = 0;
    std::int64_t mixedContentKind_ = 0;
};
