#include "tool/adm/AdmCheck.h"

#include "adm/ADMTimestamp.h"
#include "tool/shared/adm/AdmText.h"
#include "tool/shared/adm/AdmTracks.h"

#include <fmt/format.h>

#include <algorithm>
#include <string>
#include <string_view>
#include <unordered_set>

namespace {

using platform::XMLAttributes;

constexpr const char* kNoElements = "NoElements";
constexpr const char* kPrefixedName = "PrefixedName";
constexpr const char* kDuplicateID = "DuplicateID";
constexpr const char* kUnreadableTime = "UnreadableTime";

constexpr std::string_view kBlock = "audioBlockFormat";
constexpr std::string_view kChannel = "audioChannelFormat";

struct ElementName {
    std::string_view name;
    std::string_view idAttribute;
};

constexpr ElementName elementNames[] = {
    {"audioProgramme", "audioProgrammeID"},
    {"audioContent", "audioContentID"},
    {"audioObject", "audioObjectID"},
    {"audioPackFormat", "audioPackFormatID"},
    {kChannel, "audioChannelFormatID"},
    {kBlock, "audioBlockFormatID"},
    {"audioStreamFormat", "audioStreamFormatID"},
    {"audioTrackFormat", "audioTrackFormatID"},
    {"audioTrackUID", "UID"},
};

const ElementName* elementNamed(std::string_view name)
{
    const auto* found = std::find_if(std::begin(elementNames), std::end(elementNames),
                                     [name](const ElementName& each) { return each.name == name; });
    return found == std::end(elementNames) ? nullptr : found;
}

/// Receives the whole document, also the part after a problem that ended the parse.
class Listener : public platform::XMLHandler {
public:
    explicit Listener(std::vector<ADMDiagnostic>& problems) : problems_(problems) {}
    void setParser(const platform::XMLParser& parser) { parser_ = &parser; }
    /// Reports all prefixed names as one problem.
    void tellPrefixedNames()
    {
        if (prefixedNames_ == 0)
            return;
        if (prefixedNames_ > 1)
            prefixed_.text += fmt::format(", like {} of {}", prefixedNames_ == 2 ? "another" : "others",
                                          countText(prefixedNames_, "name"));
        problems_.push_back(prefixed_);
    }

    void startElement(std::string_view name, const XMLAttributes& attributes) override
    {
        const std::size_t colon = name.find(':');
        if (colon != name.npos && elementNamed(name.substr(colon + 1)) != nullptr && prefixedNames_++ == 0)
            prefixed_ = {
                parser_->elementPosition(), kPrefixedName, {}, fmt::format("'{}' has a prefix, and is not read", name)};
        const ElementName* element = elementNamed(name);
        if (element == nullptr)
            return;
        if (name == kChannel)
            blockIDs_.clear();
        const std::string id(attributes.find(element->idAttribute).value_or(""));
        if (!id.empty() && !(name == kBlock ? blockIDs_ : ids_).insert(id).second)
            tell(kDuplicateID, id, fmt::format("'{}' is defined more than once", shortened(id)));
        for (const std::string_view attribute : {"start", "end", "duration", "rtime"}) {
            const std::string_view text = attributes.find(attribute).value_or("");
            if (!text.empty() && ADMTimestampStringToMicroSeconds(text) == kADMInvalidTime)
                tell(kUnreadableTime, id, fmt::format("{} '{}' is no time", attribute, shortened(std::string(text))));
        }
    }
    void endElement(std::string_view) override {}
    void characters(std::string_view) override {}

private:
    void tell(const char* kind, const std::string& id, std::string text)
    {
        problems_.push_back({parser_->elementPosition(), kind, shortened(id), std::move(text)});
    }

    std::vector<ADMDiagnostic>& problems_;
    const platform::XMLParser* parser_ = nullptr;
    std::unordered_set<std::string> ids_;
    std::unordered_set<std::string> blockIDs_; // of the open channel only: blocks come by the million
    std::size_t prefixedNames_ = 0;
    ADMDiagnostic prefixed_;
};

bool hasElements(const ADMDocument& document)
{
    return !(document.audioProgrammes().empty() && document.audioContents().empty() &&
             document.audioObjects().empty() && document.audioPackFormats().empty() &&
             document.audioChannelFormats().empty() && document.audioStreamFormats().empty() &&
             document.audioTrackFormats().empty() && document.audioTrackUIDs().empty());
}

} // namespace

std::vector<ADMDiagnostic> checkFurther(ADMSource& source, const ADMDocument& document, bool isComplete)
{
    std::vector<ADMDiagnostic> problems;
    Listener listener(problems);
    const auto stream = source.stream();
    platform::XMLParser parser(*stream, listener);
    listener.setParser(parser);
    parser.parse(); // has reported already that it is not well-formed
    listener.tellPrefixedNames();
    if (!isComplete)
        return problems;
    if (!hasElements(document))
        problems.push_back({{}, kNoElements, {}, "no ADM elements"});
    for (ADMDiagnostic& problem : trackProblems(source, &document))
        problems.push_back(std::move(problem));
    return problems;
}
