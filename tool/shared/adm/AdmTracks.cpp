#include "tool/shared/adm/AdmTracks.h"

#include "platform/core/ASCIICase.h"
#include "platform/core/ByteReader.h"
#include "tool/shared/adm/AdmText.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <map>
#include <set>
#include <string>
#include <string_view>

namespace {

constexpr const char* kTrackMismatch = "TrackMismatch";

/// IDs are hexadecimal in upper or lower case.
std::string folded(std::string_view id)
{
    std::string text(id);
    std::transform(text.begin(), text.end(), text.begin(), asciiLower);
    return text;
}

/// One entry of the chunk "chna" (ITU-R BS.2088), 40 bytes, little-endian: the track, counted from 1, then texts of
/// fixed size, padded with zeros.
struct TrackEntry {
    unsigned track = 0;
    std::string uid, format, pack;
};

class TrackCheck {
public:
    TrackCheck(int channels, std::vector<ADMDiagnostic>& problems) : channels_(channels), problems_(problems) {}

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
        std::size_t uncounted = 0;
        for (std::size_t i = 0; i < room; ++i) {
            const TrackEntry entry = entryAt(chunk.subspan(headerSize + i * entrySize, entrySize));
            if (entry.track == 0) // unused
                continue;
            used.insert(entry.track);
            if (i < uids)
                take(entry);
            else
                ++uncounted;
        }
        if (uncounted > 0)
            tell(fmt::format("the chunk \"chna\" counts {}, and {} behind them are in use", countText(uids, "UID"),
                             uncounted));
        if (tracks != used.size())
            tell(fmt::format("the chunk \"chna\" counts {}, and uses {}", countText(tracks, "track"), used.size()));
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
            // Tracks refer to a track format, or to a channel format with "_00" appended.
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
    void take(const TrackEntry& entry)
    {
        if (static_cast<int>(entry.track) > channels_)
            tell(fmt::format("the chunk \"chna\" has '{}' in track {}, and the file {}", entry.uid, entry.track,
                             countText(static_cast<std::size_t>(channels_), "channel")));
        if (!entries_.emplace(folded(entry.uid), entry).second)
            tell(fmt::format("the chunk \"chna\" has '{}' more than once", entry.uid));
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
    std::map<std::string, TrackEntry> entries_; // by UID in lower case
};

} // namespace

std::vector<ADMDiagnostic> trackProblems(ADMSource& source, const ADMDocument* document)
{
    std::vector<ADMDiagnostic> problems;
    std::optional<Bytes> chunk;
    if (platform::Error error; !source.readTrackChunk(chunk, &error))
        throw Failure(error.description);
    if (chunk) {
        TrackCheck check(source.channels(), problems);
        check.read(*chunk);
        if (document != nullptr)
            check.compareWith(*document);
    } else if (source.isAudio() && document != nullptr && !document->audioTrackUIDs().empty()) {
        problems.push_back({{}, kTrackMismatch, {}, "no chunk \"chna\" tells where the tracks are"});
    }
    return problems;
}
