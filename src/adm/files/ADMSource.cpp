#include "adm/files/ADMSource.h"

#include "audiofile/ChunkSurvey.h"
#include "audiofile/SoundProblem.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <span>
#include <string_view>

namespace {

/// A part of a file.
class FileRangeStream : public platform::InputStream {
public:
    FileRangeStream(CFileIO& file, std::int64_t begin, std::int64_t end) : file_(file), at_(begin), end_(end) {}

    std::ptrdiff_t read(std::span<std::byte> buffer) override
    {
        const std::int64_t count = std::min(static_cast<std::int64_t>(buffer.size()), end_ - at_);
        if (count <= 0)
            return 0;
        long actual = 0;
        const std::int32_t status = file_.Read(buffer.data(), at_, static_cast<long>(count), &actual);
        at_ += actual;
        return actual > 0 ? actual : status;
    }

private:
    CFileIO& file_;
    std::int64_t at_;
    std::int64_t end_;
};

/// Whether the first bytes are a tag, or the mark of an encoding.
bool looksLikeXml(std::string_view head)
{
    using namespace std::string_view_literals;
    for (const std::string_view mark : {"\xEF\xBB\xBF"sv, "\xFE\xFF"sv, "\xFF\xFE"sv, "<\0"sv, "\0<"sv})
        if (head.starts_with(mark))
            return true;
    const std::size_t text = head.find_first_not_of(" \t\r\n");
    return text != std::string_view::npos && head[text] == '<';
}

bool failWith(platform::Error* error, ADMFileError code, std::string description)
{
    return platform::fail(error, kADMErrorDomain, static_cast<std::int64_t>(code), std::move(description));
}

bool succeeded(std::int32_t status, platform::Error* error)
{
    return status == kStatusOK || platform::fail(error, platform::ErrorDomain::status, status, StatusText(status));
}

/// False where the chunks cannot be walked.
bool survey(CAudioFileIO& file, FourCC id, ChunkSurvey& found, platform::Error* error)
{
    using Kind = ContainerProblem::Kind;
    ContainerProblem problem = SurveyChunks(file, id, found);
    if (!problem)
        return true;
    if (problem.kind == Kind::chunks)
        if (const ContainerProblem better = SoundProblem(file))
            problem = better;
    const bool isUnknown = problem.kind == Kind::empty || problem.kind == Kind::unknown;
    return failWith(error, isUnknown ? ADMFileError::unknownFile : ADMFileError::badChunk, problem.Description());
}

} // namespace

std::unique_ptr<ADMSource> ADMSource::open(const CFileRef& file, Document document, platform::Error* error)
{
    std::unique_ptr<ADMSource> source(new ADMSource);
    return source->openFile(file, document, error) ? std::move(source) : nullptr;
}

bool ADMSource::openFile(const CFileRef& file, Document document, platform::Error* error)
{
    if (!succeeded(file_.OpenForChunks(file, 0), error))
        return false;
    const std::int64_t length = file_.GetEOF();
    if (length == 0)
        return failWith(error, ADMFileError::unknownFile, "is empty");
    isAudio_ = file_.HasChunks();
    if (isAudio_)
        return findChunk(document, error);
    std::array<char, 256> head{};
    long actual = 0;
    file_.Read(head.data(), 0, static_cast<long>(std::min<std::int64_t>(length, head.size())), &actual);
    end_ = length;
    return looksLikeXml({head.data(), static_cast<std::size_t>(actual)}) ||
           failWith(error, ADMFileError::otherFile, "neither XML nor an audio file known here");
}

bool ADMSource::findChunk(Document document, platform::Error* error)
{
    ChunkSurvey found;
    if (!survey(file_, fourCC("axml"), found, error))
        return false;
    if (!found.found)
        return document == Document::mayLack || failWith(error, ADMFileError::noChunk, "has no chunk \"axml\"");
    const std::int64_t size = found.found->size;
    const std::int64_t there = std::max<std::int64_t>(found.extent.fileLength - found.found->body, 0);
    if (size < 0 || size > there)
        return failWith(error, ADMFileError::badChunk,
                        "its chunk \"axml\" claims " + std::to_string(size) + " bytes, but " + std::to_string(there) +
                            " are there");
    begin_ = found.found->body;
    end_ = begin_ + size;
    if (!dropTrailingNULs(error))
        return false;
    return hasDocument() || document == Document::mayLack ||
           failWith(error, ADMFileError::badChunk, "its chunk \"axml\" is empty");
}

std::unique_ptr<platform::InputStream> ADMSource::stream()
{
    return std::make_unique<FileRangeStream>(file_, begin_, end_);
}

bool ADMSource::readTrackChunk(std::optional<Bytes>& chunk, platform::Error* error)
{
    constexpr std::int64_t largest = 4 + 65535 * 40; // a header and as many entries as it counts
    chunk.reset();
    ChunkSurvey found;
    if (isAudio_ && !survey(file_, fourCC("chna"), found, error))
        return false;
    if (!found.found)
        return true;
    const std::int64_t offset = found.found->body;
    const std::int64_t there = std::min(found.found->size, found.extent.fileLength - offset);
    Bytes body(static_cast<std::size_t>(std::clamp<std::int64_t>(there, 0, largest)));
    if (!succeeded(file_.Read(body.data(), offset, static_cast<long>(body.size()), nullptr), error))
        return false;
    chunk = std::move(body);
    return true;
}

bool ADMSource::isUTF16()
{
    using namespace std::string_view_literals;
    std::array<char, 2> head{};
    file_.Read(head.data(), begin_, static_cast<long>(head.size()), nullptr);
    const std::string_view start(head.data(), head.size());
    return start == "\xFE\xFF"sv || start == "\xFF\xFE"sv || start == "<\0"sv || start == "\0<"sv;
}

/// In UTF-16 a zero byte may be half a character, so the remaining size is even.
bool ADMSource::dropTrailingNULs(platform::Error* error)
{
    const std::int64_t end = end_;
    std::array<char, 4096> piece;
    while (end_ > begin_) {
        const auto count = std::min(end_ - begin_, static_cast<std::int64_t>(piece.size()));
        if (!succeeded(file_.Read(piece.data(), end_ - count, static_cast<long>(count), nullptr), error))
            return false;
        const std::string_view text(piece.data(), static_cast<std::size_t>(count));
        const std::size_t last = text.find_last_not_of('\0');
        end_ -= count - (last == std::string_view::npos ? 0 : static_cast<std::int64_t>(last) + 1);
        if (last != std::string_view::npos)
            break;
    }
    if (size() % 2 != 0 && end_ < end && isUTF16())
        ++end_;
    return true;
}
