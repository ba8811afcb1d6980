#include "audiofile/SoundProblem.h"

#include "audiofile/AudioFileCheck.h"
#include "audiofile/AudioFileInfo.h"
#include "audiofile/ContainerDescriptions.h"
#include "media/containers/AudioHandle.h"
#include "platform/core/Packed.h"

#include <algorithm>
#include <array>
#include <string_view>

using Kind = ContainerProblem::Kind;

namespace {

/// A header that files of one kind begin with, and its length.
struct KnownHeader {
    std::string_view start;
    std::uint64_t length;
};
constexpr KnownHeader kKnownHeaders[] = {{"RIFF", 12}, {"RIFX", 12}, {"RF64", 12}, {"BW64", 12}, {"FORM", 12},
                                         {"CAT ", 12}, {"caff", 8},  {"riff", 40}, {".snd", 24}, {"fLaC", 42}};

bool endsInFirstHeader(FileWindow& window)
{
    std::array<std::byte, 4> start{};
    if (!window.get(start, 0))
        return false;
    const auto* const header = std::ranges::find(kKnownHeaders, textOf(BytesView(start)), &KnownHeader::start);
    return header != std::end(kKnownHeaders) && window.length() < header->length;
}

/// The problem of an MP4 file, in which a box says where the sound is.
ContainerProblem problemOfMovie(FileWindow& window)
{
    constexpr std::uint64_t toTheEnd = 0, inNext8 = 1;
    bool isFirst = true;
    for (std::uint64_t at = 0; window.length() - at >= 8;) {
        std::array<std::byte, 16> header{};
        if (window.readSome(header.data(), at, header.size()) < 8)
            return {};
        const auto type = loadBE<FourCC>(header.data() + 4);
        std::uint64_t size = loadBE<std::uint32_t>(header.data());
        if (isFirst && type != fourCC("ftyp") && type != fourCC("mdat"))
            return {};
        if (type == fourCC("moov") || type == fourCC("moof"))
            return {};
        if (size == inNext8)
            size = loadBE<std::uint64_t>(header.data() + 8);
        if (size == toTheEnd || size < 8 || size >= window.length() - at) {
            const bool isCut = isFirst && type == fourCC("ftyp");
            return isCut ? ContainerProblem{Kind::headerCut}
                         : ContainerProblem{.kind = Kind::noIndex, .id = fourCC("moov")};
        }
        at += size;
        isFirst = false;
    }
    return {};
}

/// The problem of a container whose chunks do not tell what its sound is, or where.
ContainerProblem problemOfChunks(CFileIO& file, bool hasChunks)
{
    using Finding = platform::ContainerFinding;
    std::vector<Finding> findings;
    if (CheckAudioFile(file, findings) != kStatusOK)
        return {Kind::headerCut};
    const auto find = [&](std::initializer_list<Finding::Kind> kinds) -> const Finding* {
        const auto found = std::ranges::find_if(
            findings, [&](const Finding& finding) { return std::ranges::find(kinds, finding.kind) != kinds.end(); });
        return found != findings.end() ? &*found : nullptr;
    };
    if (find({Finding::Kind::containerIsCut, Finding::Kind::chunkIsCut, Finding::Kind::sizes64AreMissing}) != nullptr)
        return {Kind::headerCut};
    if (const Finding* const missing = find({Finding::Kind::formatIsMissing}))
        return {.kind = Kind::noFormat, .id = missing->chunk};
    if (const Finding* const missing = find({Finding::Kind::soundIsMissing}))
        return {.kind = Kind::noSound, .id = hasChunks ? missing->chunk : 0};
    return {Kind::headerCut};
}

} // namespace

ContainerProblem SoundProblem(CFileIO& file)
{
    FileWindow window(file, file.GetEOF());
    if (window.length() == 0)
        return {Kind::empty};
    AudioFileInfo info;
    const std::int32_t status = DescribeAudioFile(window, file.IsMemoryFile() ? nullptr : file.URL(), info);
    ContainerProblem problem;
    if (window.failure() != kStatusOK)
        problem = ContainerProblem::ofStatus(status);
    else if (status == kStatusEndOfFile)
        problem = endsInFirstHeader(window) ? ContainerProblem{Kind::headerCut}
                                            : problemOfChunks(file, info.containerId != fourCC("NeXT"));
    else if (status == kStatusParameterError || (status == kStatusOK && info.containerId == 0))
        problem = endsInFirstHeader(window) ? ContainerProblem{Kind::headerCut} : ContainerProblem{Kind::unknown};
    else if (status == kStatusIOError)
        problem = problemOfMovie(window);
    else if (status != kStatusOK && status != platform::AudioHandle::kFormatNotSupported)
        problem = ContainerProblem::ofStatus(status);
    return window.failure() != kStatusOK ? ContainerProblem::ofStatus(window.failure()) : problem;
}
