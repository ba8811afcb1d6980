#include "tool/adm/AdmCheck.h"

#include "adm/ADMTimestamp.h"
#include "platform/core/ASCIICase.h"
#include "platform/core/ByteReader.h"
#include "tool/adm/AdmWords.h"

#include <fmt/format.h>

#include <algorithm>
#include <map>
#include <set>
#include <string>
#include <string_view>
#include <unordered_set>

namespace {

using platform::XMLAttributes;

constexpr const char* kNoElements = "NoElements";
constexpr const char* kPrefixedName = "PrefixedName";
constexpr const char* kDuplicateID = "DuplicateID";
constexpr const char* kUnreadableTime = "UnreadableTime";
constexpr const char* kTrackMismatch = "TrackMismatch";

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

/// Hears the whole document, also what stands behind a problem that ended the parse.
class Listener : public platform::XMLHandler {
public:
    explicit Listener(std::vector<ADMDiagnostic>& problems) : problems_(problems) {}
    void setParser(const platform::XMLParser& parser) { parser_ = &parser; }
    /// Of all prefixed names, one problem.
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
    std::unordered_set<std::string> blockIDs_; // of the channel that is open: blocks come by the million
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

/// IDs are hexadecimal, in upper or lower case.
std::string folded(std::string_view id)
{
    std::string text(id);
    std::transform(text.begin(), text.end(), text.begin(), asciiLower);
    return text;
}

/// One entry of the chunk "chna" (ITU-R BS.2088), 40 bytes, little-endian: the track from 1 on, then texts of a fixed
/// size, filled up with zeros.
struct TrackEntry {
    unsigned track = 0;
    std::string uid, format, pack;
};

class TrackCheck {
public:
    TrackCheck(BytesView chunk, int channels, std::vector<ADMDiagnostic>& problems)
        : channels_(channels),
          problems_(problems)
    {
        read(chunk);
    }

    void compareWith(const ADMDocument& document)
    {
        std::set<std::string> defined;
        for (const ADMAudioTrackUID& track : document.audioTrackUIDs()) {
            const auto entry = entries_.find(folded(track.audioTrackUIDID()));
            defined.insert(folded(track.audioTrackUIDID()));
            if (entry == entries_.end()) {
                tell(fmt::format("'{}' is not in the chunk \"chna\"", shortened(track.audioTrackUIDID())), &track);
                continue;
            }
            // The reference to a track is that of a track format, or of a channel format with "_00" behind it.
            std::string_view format = entry->second.format;
            if (track.audioTrackFormatIDRef())
                compare(track, *track.audioTrackFormatIDRef(), format);
            else if (track.audioChannelFormatIDRef() && format.ends_with("_00"))
                compare(track, *track.audioChannelFormatIDRef(), format.substr(0, format.size() - 3));
            if (track.audioPackFormatIDRef())
                compare(track, *track.audioPackFormatIDRef(), entry->second.pack);
        }
        for (const auto& [id, entry] : entries_)
            if (!defined.contains(id))
                tell(fmt::format("'{}' of the chunk \"chna\" is not defined", entry.uid));
    }

private:
    void read(BytesView chunk)
    {
        constexpr std::size_t headerSize = 4, entrySize = 40;
        if (chunk.size() < headerSize)
            return tell(
                fmt::format("the chunk \"chna\" has {}, too few for its header", countText(chunk.size(), "byte")));
        const unsigned tracks = loadLE<std::uint16_t>(chunk.data()), uids = loadLE<std::uint16_t>(chunk.data() + 2);
        const std::size_t room = (chunk.size() - headerSize) / entrySize;
        if (uids > room)
            tell(fmt::format("the chunk \"chna\" claims {} entries, and has room for {}", uids, room));
        std::set<unsigned> used;
        for (std::size_t i = 0; i < room; ++i) {
            const TrackEntry entry = entryAt(chunk.subspan(headerSize + i * entrySize, entrySize));
            if (entry.track == 0) // not in use
                continue;
            used.insert(entry.track);
            if (i >= uids)
                continue;
            if (static_cast<int>(entry.track) > channels_)
                tell(fmt::format("the chunk \"chna\" has '{}' in track {}, and the file {}", entry.uid, entry.track,
                                 countText(static_cast<std::size_t>(channels_), "channel")));
            if (!entries_.emplace(folded(entry.uid), entry).second)
                tell(fmt::format("the chunk \"chna\" has '{}' more than once", entry.uid));
        }
        if (tracks != used.size())
            tell(fmt::format("the chunk \"chna\" counts {}, and uses {}", countText(tracks, "track"), used.size()));
    }

    static TrackEntry entryAt(BytesView bytes)
    {
        const auto text = [bytes](std::size_t offset, std::size_t size) {
            const std::string_view field = textOf(bytes.subspan(offset, size));
            return std::string(field.substr(0, field.find('\0')));
        };
        return {loadLE<std::uint16_t>(bytes.data()), text(2, 12), text(14, 14), text(28, 11)};
    }

    void compare(const ADMAudioTrackUID& track, const std::string& here, std::string_view there)
    {
        if (!there.empty() && folded(here) != folded(there))
            tell(fmt::format("'{}' is of '{}', and of '{}' in the chunk \"chna\"", shortened(track.audioTrackUIDID()),
                             shortened(here), there),
                 &track);
    }

    void tell(std::string text, const ADMAudioTrackUID* track = nullptr)
    {
        problems_.push_back({track != nullptr ? track->documentPosition() : platform::XMLPosition(), kTrackMismatch,
                             track != nullptr ? shortened(track->audioTrackUIDID()) : "", std::move(text)});
    }

    int channels_;
    std::vector<ADMDiagnostic>& problems_;
    std::map<std::string, TrackEntry> entries_; // by UID, in lower case
};

} // namespace

std::vector<ADMDiagnostic> checkFurther(AdmSource& source, const ADMDocument& document, bool isComplete)
{
    std::vector<ADMDiagnostic> problems;
    Listener listener(problems);
    const auto stream = source.stream();
    platform::XMLParser parser(*stream, listener);
    listener.setParser(parser);
    parser.parse(); // that it is not well-formed has been told
    listener.tellPrefixedNames();
    if (!isComplete)
        return problems;
    if (!hasElements(document))
        problems.push_back({{}, kNoElements, {}, "no ADM elements"});
    if (const auto chunk = source.trackChunk())
        TrackCheck(*chunk, source.channels(), problems).compareWith(document);
    else if (source.isAudio() && !document.audioTrackUIDs().empty())
        problems.push_back({{}, kTrackMismatch, {}, "no chunk \"chna\" tells where the tracks are"});
    return problems;
}
