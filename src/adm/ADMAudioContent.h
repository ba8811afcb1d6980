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

/// Objects that belong together, such as all dialogue or all effects. Its links are owned by the document.
class KT_EXPORT ADMAudioContent : public ADMElement {
public:
    /// `audioContentWithAttributes:`. Raises what the constructor raises.
    static std::unique_ptr<ADMAudioContent> audioContentWithAttributes(const platform::XMLAttributes& attributes);
    /// Raises MalformedDefinition without an ID or a name, WrongIDPrefix unless the ID begins with ACO.
    explicit ADMAudioContent(const platform::XMLAttributes& attributes);

    /// ACO_xxxx, as written.
    const std::string& audioContentID() const { return audioContentID_; }
    void setAudioContentID(std::string value) { audioContentID_ = std::move(value); }
    /// The four digits of the ID.
    std::uint32_t index() const { return index_; }
    void setIndex(std::uint32_t value) { index_ = value; }
    /// Never empty in a parsed document.
    const std::string& audioContentName() const { return audioContentName_; }
    void setAudioContentName(std::string value) { audioContentName_ = std::move(value); }
    /// A language code as written ("en"); null when it is not given.
    const std::optional<std::string>& audioContentLanguage() const { return audioContentLanguage_; }
    void setAudioContentLanguage(std::optional<std::string> value) { audioContentLanguage_ = std::move(value); }
    /// The IDs of its objects, in document order.
    const std::vector<std::string>& audioObjectIDRefs() const { return audioObjects_.ids; }
    void setAudioObjectIDRefs(std::vector<std::string> value) { audioObjects_.ids = std::move(value); }
    /// The objects of audioObjectIDRefs(), filled in when the document is complete; null where an ID was let pass.
    const std::vector<ADMAudioObject*>& audioObjects() const { return audioObjects_.elements; }
    void setAudioObjects(std::vector<ADMAudioObject*> value) { audioObjects_.elements = std::move(value); }
    /// The labels by language.
    const ADMLabels& audioContentLabels() const { return audioContentLabels_; }
    void setAudioContentLabels(ADMLabels value) { audioContentLabels_ = std::move(value); }
    /// 0 without dialogue, 1 with, 2 mixed, as written, unchecked; 2 when it is not given.
    std::int64_t dialogueMode() const { return dialogueMode_; }
    void setDialogueMode(std::int64_t value) { dialogueMode_ = value; }
    /// What sound without dialogue is: 0 undefined, 1 music, 2 effect; 0 when it is not given.
    std::int64_t nonDialogueContentKind() const { return nonDialogueContentKind_; }
    void setNonDialogueContentKind(std::int64_t value) { nonDialogueContentKind_ = value; }
    /// What dialogue is: 0 undefined, 1 storyline, 2 voice-over, 3 spoken subtitles, 4 audio description, 5
    /// commentary, 6 emergency; 0 when it is not given.
    std::int64_t dialogueContentKind() const { return dialogueContentKind_; }
    void setDialogueContentKind(std::int64_t value) { dialogueContentKind_ = value; }
    /// What a mix is: 0 undefined, 1 complete main, 2 mixed, 3 hearing impaired; 0 when it is not given.
    std::int64_t mixedContentKind() const { return mixedContentKind_; }
    void setMixedContentKind(std::int64_t value) { mixedContentKind_ = value; }

    std::string_view elementName() const override { return "audioContent"; }
    std::string elementID() const override { return audioContentID_; }
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    /// Appends to audioObjectIDRefs().
    void addSubElement_audioObjectIDRef(std::string_view value, const platform::XMLAttributes& attributes);
    /// Adds to audioContentLabels() under the attribute "language"; ignored without one.
    void addSubElement_audioContentLabel(std::string_view value, const platform::XMLAttributes& attributes);
    /// Sets dialogueMode() and, from the attributes, the three kinds.
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
