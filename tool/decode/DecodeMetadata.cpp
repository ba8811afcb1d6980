#include "tool/decode/DecodeMetadata.h"

#include "audiofile/CAudioFileIO.h"
#include "loops/tagging/CAFPayloads.h"
#include "loops/tags/LoopTagFields.h"
#include "platform/core/ByteWriter.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/portable/PortableMarkers.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>

using platform::ContainerKind;

namespace {

constexpr FourCC kBext = fourCC("bext"), kIXML = fourCC("iXML"), kAxml = fourCC("axml"), kChna = fourCC("chna"),
                 kCue = fourCC("cue "), kDigest = fourCC("MD5 "), kList = fourCC("LIST"), kMark = fourCC("MARK"),
                 kRemark = fourCC("ANNO"), kComments = fourCC("COMT"), kCAFInfo = fourCC("info"),
                 kCAFMarkers = fourCC("mark"), kCAFTexts = fourCC("strg");
constexpr std::array kOfWAVE{kBext, kIXML, kAxml, kChna, kCue, kList, kDigest};
constexpr std::array kOfAIFF{kMark, kComments, fourCC("NAME"), fourCC("AUTH"), fourCC("(c) "), kRemark};
constexpr std::array kOfCAF{kCAFInfo, kCAFMarkers, kCAFTexts};
constexpr std::array<std::string_view, 7> kOfTexts{"INFO", "info", "NAME", "AUTH", "(c)", "ANNO", "COMT"};
/// More than people write; all of it is held in memory.
constexpr std::int64_t kMostBytes = 256 << 20;

FourCC formOf(const HeldChunk& chunk)
{
    return chunk.id == kList && chunk.body.size() >= sizeof(FourCC) ? loadBE<FourCC>(chunk.body.data()) : 0;
}

std::string nameOf(const HeldChunk& chunk)
{
    const std::string text = fourCCText(formOf(chunk) != 0 ? formOf(chunk) : chunk.id);
    return text.substr(0, text.find_last_not_of(' ') + 1);
}

bool isTagText(std::string_view key)
{
    return std::ranges::any_of(loopTagFields(),
                               [key](const LoopTagField& field) { return field.isFileInfo && field.name == key; });
}

void write(ByteWriter& out, const HeldChunk& chunk, FourCC fileType)
{
    out.writeFourCC(chunk.id);
    if (fileType == kCaff)
        out.write(std::int64_t{std::ssize(chunk.body)});
    else
        out.write(static_cast<std::uint32_t>(chunk.body.size()));
    out.write(chunk.body);
    if (fileType != kCaff)
        out.writeZeros(chunk.body.size() & 1);
}

} // namespace

DecodeMetadata::DecodeMetadata(const std::string& path)
{
    CAudioFileIO file;
    if (file.OpenForChunks(referenceTo(path), 0) != kStatusOK || !file.HasChunks())
        return;
    bits_ = file.Info().bitsPerSample;
    channels_ = file.Info().channels;
    isFloat_ = file.Info().floatingPoint;
    isLinearPCM_ = file.Info().IsLinearPCM();
    ContainerExtent extent;
    std::int64_t room = kMostBytes;
    const auto visit = [&](const ChunkEntry& chunk) {
        family_ = familyOf(extent.kind);
        order_ = extent.kind == ContainerKind::rifx ? std::endian::big : std::endian::little;
        const auto ids = chunksOf(family_);
        if (std::ranges::find(ids, chunk.id) == ids.end())
            return true;
        const bool isThere = chunk.size >= 0 && chunk.size <= std::min(extent.fileLength - chunk.body, room);
        HeldChunk held{chunk.id, Bytes(static_cast<std::size_t>(isThere ? chunk.size : 0))};
        const auto size = std::ssize(held.body);
        if (isThere && (size == 0 || file.Read(held.body.data(), chunk.body, size, nullptr) == kStatusOK)) {
            room -= size;
            chunks_.push_back(std::move(held));
        } else {
            lost_.push_back(chunk.id);
        }
        return true;
    };
    file.ForEachChunk(visit, &extent);
}

DecodeMetadata::Family DecodeMetadata::familyOf(ContainerKind kind)
{
    switch (kind) {
    case ContainerKind::riff:
    case ContainerKind::rifx:
    case ContainerKind::wave64:
        return Family::wave;
    case ContainerKind::iff:
        return Family::aiff;
    case ContainerKind::caf:
        return Family::caf;
    default:
        return Family::none;
    }
}

std::span<const FourCC> DecodeMetadata::chunksOf(Family family)
{
    switch (family) {
    case Family::wave:
        return kOfWAVE;
    case Family::aiff:
        return kOfAIFF;
    case Family::caf:
        return kOfCAF;
    default:
        return {};
    }
}

/// The metadata of one output while it is made.
class DecodeMetadata::Keeper {
public:
    Keeper(const DecodeMetadata& source, FourCC fileType, const BroadcastChange& changed, FollowingTags following)
        : source_(source),
          fileType_(fileType),
          changed_(changed),
          following_(following),
          cues_(changed.change, source.order_, source.isLinearPCM_)
    {
    }

    KeptMetadata run()
    {
        const Family target = familyOfType(fileType_);
        if (target == Family::none || source_.family_ == Family::none)
            return {};
        if (target == source_.family_)
            copy();
        else
            translate();
        if (dropped_ > 0)
            kept_.notKept.push_back(
                fmt::format("{} of its markers {} cut off", dropped_, dropped_ == 1 ? "is" : "are"));
        return finish();
    }

private:
    static Family familyOfType(FourCC fileType)
    {
        switch (fileType) {
        case kWAVE:
            return Family::wave;
        case kAIFF:
            return Family::aiff;
        case kCaff:
            return Family::caf;
        default:
            return Family::none;
        }
    }

    const SoundChange& change() const { return changed_.change; }

    void keep(FourCC sourceId, HeldChunk chunk)
    {
        told(sourceId);
        if (chunk.body.empty())
            return;
        const std::string name = nameOf(chunk);
        if (std::ranges::find(kept_.names, name) == kept_.names.end())
            kept_.names.push_back(name);
        kept_.hasTexts = kept_.hasTexts || std::ranges::find(kOfTexts, name) != kOfTexts.end();
        chunks_.push_back(std::move(chunk));
    }
    void told(FourCC sourceId) { kept_.sourceIds.push_back(sourceId); }

    /// For a file of the same kind: the same chunks in the same order.
    void copy()
    {
        // Labels of dropped points are dropped too, wherever they stand.
        std::vector<Bytes> cues;
        for (const HeldChunk& chunk : source_.chunks_)
            if (chunk.id == kCue && source_.family_ == Family::wave)
                cues.push_back(cues_.movedCues(chunk.body));
        dropped_ += cues_.dropped();
        std::size_t nextCue = 0;
        bool leavesList = false;
        for (const HeldChunk& chunk : source_.chunks_) {
            const BytesView body = chunk.body;
            if (chunk.id == kBext)
                keep(kBext, {kBext, changedBroadcastExtension(body, source_.order_, changed_)});
            else if (chunk.id == kIXML)
                keep(kIXML, {kIXML, changedIXML(body, changed_, kept_.notKept)});
            else if (chunk.id == kAxml || chunk.id == kChna)
                copyADM(chunk);
            else if (chunk.id == kCue)
                keep(kCue, {kCue, std::move(cues[nextCue++])});
            else if (chunk.id == kList)
                leavesList = !copyList(chunk) || leavesList;
            else if (chunk.id == kMark)
                keep(kMark, {kMark, movedMarks(body, change(), dropped_)});
            else if (chunk.id == kCAFMarkers)
                keep(kCAFMarkers, {kCAFMarkers, movedCAFMarkers(body, change(), dropped_)});
            else if (chunk.id == kCAFInfo)
                copyCAFInfo(chunk);
            else if (chunk.id == kDigest)
                copyDigest(chunk);
            else if (chunk.id == kCAFTexts || chunk.id == kRemark || chunk.id == kComments || !following_.texts)
                keep(chunk.id, chunk);
        }
        if (leavesList)
            std::erase(kept_.sourceIds, kList);
    }

    /// An ADM document does not describe another part or other channels.
    void copyADM(const HeldChunk& chunk)
    {
        if (!change().isWhole || !changed_.keepsChannels)
            return;
        keep(chunk.id, chunk);
        const bool saysRates = chunk.id == kAxml && textOf(chunk.body).find("sampleRate=") != std::string_view::npos;
        if (saysRates && changed_.isRecoded)
            kept_.notKept.emplace_back("axml still has the sample rates and bit depths of the file");
    }

    /// A digest remains valid only for the same bytes.
    void copyDigest(const HeldChunk& chunk)
    {
        if (change().isWhole && !changed_.isRecoded && source_.order_ == std::endian::little)
            keep(kDigest, chunk);
    }

    bool copyList(const HeldChunk& chunk)
    {
        const FourCC form = formOf(chunk);
        if (form == fourCC("adtl")) {
            keep(kList, {kList, cues_.movedLabels(chunk.body)});
        } else if (form == fourCC("INFO") && source_.order_ == std::endian::little) {
            keep(kList, chunk);
        } else if (form == fourCC("INFO")) {
            PortableTexts texts;
            texts.addFromWAVE(chunk.body, source_.order_);
            keepTexts(kList, texts);
        } else {
            return false;
        }
        return true;
    }

    void copyCAFInfo(const HeldChunk& chunk)
    {
        tagging::StringPairs pairs;
        tagging::ForEachCAFInfoString(chunk.body, [&](std::string_view key, std::string_view text) {
            if (!isOfOneCoding(key) && !(following_.texts && isTagText(key)))
                pairs.emplace(key, text);
        });
        told(kCAFInfo);
        if (auto info = pairs.empty() ? std::nullopt : CAFInfoStringsData(pairs))
            keep(kCAFInfo, {kCAFInfo, std::move(*info)});
    }

    /// For a file of another kind: everything that it has a place for.
    void translate()
    {
        PortableTexts texts;
        PortableMarkers markers;
        if (source_.family_ == Family::wave)
            readWAVE(texts, markers);
        else if (source_.family_ == Family::aiff)
            readAIFF(texts, markers);
        else
            readCAF(texts, markers);
        if (following_.genre && fileType_ == kAIFF) // AIFF's texts have no place for a genre
            std::erase_if(texts.texts, [](const auto& each) { return each.first == "genre"; });
        keepTexts(0, texts);
        dropped_ += markers.move(change());
        std::size_t left = 0;
        for (HeldChunk& chunk : markers.chunksFor(fileType_, left))
            keep(0, std::move(chunk));
        if (left > 0)
            kept_.notKept.push_back(fmt::format("{} of its markers have no room there", left));
        if (markers.hasMore)
            kept_.notKept.emplace_back("of its markers only places and names are kept");
    }

    void readWAVE(PortableTexts& texts, PortableMarkers& markers)
    {
        std::vector<BytesView> lists;
        bool leavesList = false;
        for (const HeldChunk& chunk : source_.chunks_)
            if (chunk.id == kList) {
                const FourCC form = formOf(chunk);
                texts.addFromWAVE(chunk.body, source_.order_);
                if (form == fourCC("adtl"))
                    lists.push_back(chunk.body);
                leavesList = leavesList || (form != fourCC("adtl") && form != fourCC("INFO"));
            }
        for (const HeldChunk& chunk : source_.chunks_)
            if (chunk.id == kCue) {
                markers.addFromWAVE(chunk.body, lists, source_.order_, source_.isLinearPCM_);
                told(kCue);
            }
        if (!leavesList)
            told(kList);
    }

    /// The loop's tags bring comments, which replace remarks.
    void readAIFF(PortableTexts& texts, PortableMarkers& markers)
    {
        PortableTexts comments;
        for (const HeldChunk& chunk : source_.chunks_)
            if (chunk.id == kComments)
                markers.hasMore = comments.addComments(chunk.body) || markers.hasMore;
        for (const HeldChunk& chunk : source_.chunks_) {
            if (chunk.id == kRemark && following_.texts && !comments.texts.empty())
                continue;
            if (chunk.id == kMark)
                markers.addFromAIFF(chunk.body);
            else if (chunk.id == kComments && !following_.texts)
                texts.addComments(chunk.body);
            else if (chunk.id == kRemark || !following_.texts)
                texts.addFromAIFF(chunk.id, chunk.body);
            told(chunk.id);
        }
    }

    void readCAF(PortableTexts& texts, PortableMarkers& markers)
    {
        BytesView names;
        for (const HeldChunk& chunk : source_.chunks_) {
            if (chunk.id == kCAFTexts)
                names = chunk.body;
            else if (chunk.id == kCAFInfo)
                texts.addFromCAF(chunk.body);
            told(chunk.id);
        }
        if (following_.texts)
            std::erase_if(texts.texts, [](const auto& each) { return isTagText(each.first); });
        for (const HeldChunk& chunk : source_.chunks_)
            if (chunk.id == kCAFMarkers)
                markers.addFromCAF(chunk.body, names);
    }

    void keepTexts(FourCC sourceId, const PortableTexts& texts)
    {
        std::vector<std::string> left = texts.others;
        for (HeldChunk& chunk : texts.chunksFor(fileType_, left))
            keep(sourceId, std::move(chunk));
        if (left.size() > kMostNamed)
            left.resize(kMostNamed);
        if (!left.empty())
            kept_.notKept.push_back(fmt::format("of its texts {} {} not carried over", fmt::join(left, ", "),
                                                left.size() == 1 ? "is" : "are"));
    }

    KeptMetadata finish()
    {
        ByteWriter out(fileType_ == kWAVE ? std::endian::little : std::endian::big);
        for (const HeldChunk& chunk : chunks_)
            write(out, chunk, fileType_);
        kept_.chunks = out.take();
        std::erase_if(kept_.sourceIds,
                      [this](FourCC id) { return std::ranges::find(source_.lost_, id) != source_.lost_.end(); });
        return std::move(kept_);
    }

    static constexpr std::size_t kMostNamed = 12;

    const DecodeMetadata& source_;
    FourCC fileType_;
    BroadcastChange changed_;
    FollowingTags following_;
    CueMove cues_;
    std::size_t dropped_ = 0;
    std::vector<HeldChunk> chunks_;
    KeptMetadata kept_;
};

KeptMetadata DecodeMetadata::keptIn(FourCC fileType, SoundChange change, const DecodedSound& sound,
                                    FollowingTags following) const
{
    const bool keepsChannels = channels_ == static_cast<int>(sound.channels);
    const bool keepsCoding = isLinearPCM_ && keepsChannels && change.keepsRate() && bits_ == sound.depth.bits &&
                             isFloat_ == sound.depth.isFloat;
    return Keeper(*this, fileType, {change, sound, !keepsCoding, keepsChannels}, following).run();
}
