#include "EditGuards.h"

#include "ChunkBody.h"
#include "Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <span>
#include <string_view>

namespace {

constexpr std::int64_t kCAFOpenEnd = -1;

// Where the library puts a new chunk: behind the last one, by what the container says of its size.
struct Insertion {
    std::int64_t at = 0;
    ChkHeader last; // the chunk ahead of it, whose size the library adapts to end there
    std::int64_t lastPosition = 0;
    std::int64_t lastSize = 0;
};

// Chunks without which the sound, or the way to it, is gone. A container has one of each.
std::span<const std::string_view> structuralChunks(FourCC container)
{
    static constexpr std::array<std::string_view, 3> wave{"fmt ", "data", "ds64"};
    static constexpr std::array<std::string_view, 2> aiff{"COMM", "SSND"};
    static constexpr std::array<std::string_view, 4> caf{"desc", "data", "pakt", "kuki"};
    static constexpr std::array<std::string_view, 1> rex{"HEAD"};
    switch (container) {
    case kFORM:
        return aiff;
    case kCaff:
        return caf;
    case kCAT:
        return rex;
    default:
        return wave;
    }
}

bool isStructural(FourCC container, FourCC id)
{
    const auto chunks = structuralChunks(container);
    return std::find(chunks.begin(), chunks.end(), fourCCText(id)) != chunks.end();
}

bool looksLikeAnId(FourCC id)
{
    return id != 0 && fourCCText(id).size() == 4;
}

Insertion insertionPoint(CAudioFileIO& file, const ContainerExtent& extent)
{
    ContainerChkExtended header;
    if (file.ReadExtendedFileHeader(header) != 0)
        throw Failure("its container header cannot be read");
    ChkHeader current = {}, next = {};
    int error = 0;
    long long position = file.NextChunkHeader(0, &current, &current, &error, header);
    while (error == 0) {
        const long long following = file.NextChunkHeader(position, &current, &next, &error, header);
        if (following >= extent.end || following <= position)
            return {std::min<std::int64_t>(following, extent.fileLength), current, position,
                    current.EffectiveSize(header)};
        position = following;
        current = next;
    }
    throw Failure("its chunks cannot be walked");
}

std::optional<std::string> objectionInChunks(CAudioFileIO& file, const ChunkSurvey& survey, std::int64_t size)
{
    const ContainerExtent& extent = survey.extent;
    const Insertion insertion = insertionPoint(file, extent);
    const std::int64_t behind = extent.fileLength - insertion.at;
    if (behind > 0) {
        const std::int64_t needed = std::int64_t{sizeof(ChkHeader)} + size + (size & 1);
        return fmt::format("its container ends at byte {}, but {} bytes follow its chunks (an unfinished recording?), "
                           "and the new chunk would be written over {} of them",
                           extent.end, behind, std::min(behind, needed));
    }
    const std::int64_t lastEnd = insertion.lastPosition + std::int64_t{sizeof(ChkHeader)} + insertion.lastSize;
    const std::int64_t padded = lastEnd + (insertion.lastSize & 1);
    if (padded == insertion.at)
        return std::nullopt;
    if (!looksLikeAnId(insertion.last.id))
        return fmt::format("what stands at byte {} is no chunk, and 8 bytes of it would be written over",
                           insertion.lastPosition);
    if (insertion.at > padded)
        return fmt::format("{} stray bytes at its end would become part of the chunk \"{}\"", insertion.at - padded,
                           fourCCText(insertion.last.id));
    return std::nullopt; // a last chunk that claims more than is there: its size is put right
}

std::optional<std::string> objectionInCAF(const ChunkSurvey& survey)
{
    if (!survey.last)
        return "it holds no chunk that can be read";
    const ChunkEntry& last = *survey.last;
    const std::int64_t missing = last.size - (survey.extent.fileLength - bodyOffset(last, survey.extent));
    if (last.size < 0 || missing > 0)
        return fmt::format(
            "its last chunk, \"{}\", claims more bytes than the file has, and the new chunk would become "
            "part of it",
            fourCCText(last.id));
    if (missing < 0)
        return fmt::format("{} stray bytes follow its last chunk, and a chunk behind them would not be found",
                           -missing);
    return std::nullopt;
}

} // namespace

ChunkSurvey surveyChunks(CAudioFileIO& file, FourCC id)
{
    ChunkSurvey survey;
    const std::int32_t status = file.ForEachChunk(
        [&](const ChunkEntry& chunk) {
            survey.last = chunk;
            if (chunk.id != id)
                return true;
            ++survey.count;
            survey.total += std::max<std::int64_t>(chunk.size, 0);
            // An empty chunk of a CAF file is found only when there is no other.
            if (survey.extent.id != kCaff || !survey.found || survey.found->size == 0)
                survey.found = chunk;
            return true;
        },
        &survey.extent);
    if (status != kStatusOK)
        throw Failure("its chunks cannot be read");
    return survey;
}

std::optional<std::string> objectionToAdding(CAudioFileIO& file, const ChunkSurvey& survey, FourCC id,
                                             std::int64_t size)
{
    if (survey.count > 0 && isStructural(survey.extent.id, id))
        return fmt::format("it has a chunk \"{}\", which describes or holds its sound, and has room for one only",
                           fourCCText(id));
    return survey.isCAF() ? objectionInCAF(survey) : objectionInChunks(file, survey, size);
}

std::optional<std::string> objectionToRemoving(const ChunkSurvey& survey, FourCC id)
{
    if (survey.count > 0 && isStructural(survey.extent.id, id))
        return fmt::format("the chunk \"{}\" describes or holds its sound, which would be lost", fourCCText(id));
    return std::nullopt;
}

void settleOpenEndedData(CAudioFileIO& file)
{
    const ChunkSurvey survey = surveyChunks(file, kData);
    if (!survey.isCAF() || !survey.last || survey.last->id != kData)
        return;
    const std::int64_t sizeAt = survey.last->offset + std::int64_t{offsetof(CAFChunkHeader, size)};
    std::int64_t stored = 0;
    requireOK(file.Read(&stored, sizeAt, sizeof stored, nullptr));
    if (inByteOrder(stored, std::endian::big) != kCAFOpenEnd)
        return;
    const std::int64_t size = inByteOrder(file.GetEOF() - bodyOffset(*survey.last, survey.extent), std::endian::big);
    requireOK(file.Write(&size, sizeAt, sizeof size));
}
