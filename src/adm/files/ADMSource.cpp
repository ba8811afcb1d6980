#include "tool/shared/adm/AdmSource.h"

#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/input/ChunkBody.h"
#include "tool/shared/input/FoundFile.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

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

} // namespace

AdmSource::AdmSource(const std::string& path, Document document)
{
    requireOK(file_.OpenForChunks(referenceTo(path), 0));
    const std::int64_t length = file_.GetEOF();
    if (length == 0)
        throw OtherKind("is empty", OtherKind::Kind::unknown);
    if (file_.HasChunks()) {
        isAudio_ = true;
        if (const bool isThere = surveyChunks(file_, fourCC("axml")).found.has_value(); !isThere) {
            if (document == Document::mayLack)
                return;
            throw OtherKind("has no chunk \"axml\"", OtherKind::Kind::audio);
        }
        const ChunkBody chunk = requireChunk(file_, fourCC("axml"));
        begin_ = chunk.offset;
        end_ = chunk.offset + chunk.size;
        dropTrailingNuls();
        if (size() == 0 && document == Document::isThere)
            throw Failure("its chunk \"axml\" is empty");
        return;
    }
    std::array<char, 256> head{};
    long actual = 0;
    file_.Read(head.data(), 0, static_cast<long>(std::min<std::int64_t>(length, head.size())), &actual);
    if (!looksLikeXml({head.data(), static_cast<std::size_t>(actual)}))
        throw OtherKind("neither XML nor an audio file known here",
                        isCalledContainer(path) ? OtherKind::Kind::unknown : OtherKind::Kind::audio);
    end_ = length;
}

std::unique_ptr<platform::InputStream> AdmSource::stream()
{
    return std::make_unique<FileRangeStream>(file_, begin_, end_);
}

std::optional<Bytes> AdmSource::trackChunk()
{
    constexpr std::int64_t largest = 4 + 65535 * 40; // a header and the most entries that it can count
    const ChunkSurvey survey = isAudio_ ? surveyChunks(file_, fourCC("chna")) : ChunkSurvey();
    if (!survey.found)
        return std::nullopt;
    const std::int64_t offset = survey.found->body;
    const std::int64_t there = std::min(survey.found->size, survey.extent.fileLength - offset);
    Bytes body(static_cast<std::size_t>(std::clamp<std::int64_t>(there, 0, largest)));
    requireOK(file_.Read(body.data(), offset, static_cast<long>(body.size()), nullptr));
    return body;
}

bool AdmSource::isUTF16()
{
    using namespace std::string_view_literals;
    std::array<char, 2> head{};
    file_.Read(head.data(), begin_, static_cast<long>(head.size()), nullptr);
    const std::string_view start(head.data(), head.size());
    return start == "\xFE\xFF"sv || start == "\xFF\xFE"sv || start == "<\0"sv || start == "\0<"sv;
}

/// In UTF-16 a zero byte may be half a character, so the remaining size is even.
void AdmSource::dropTrailingNuls()
{
    const std::int64_t end = end_;
    std::array<char, 4096> piece;
    while (end_ > begin_) {
        const auto count = std::min(end_ - begin_, static_cast<std::int64_t>(piece.size()));
        requireOK(file_.Read(piece.data(), end_ - count, static_cast<long>(count), nullptr));
        const std::string_view text(piece.data(), static_cast<std::size_t>(count));
        const std::size_t last = text.find_last_not_of('\0');
        end_ -= count - (last == std::string_view::npos ? 0 : static_cast<std::int64_t>(last) + 1);
        if (last != std::string_view::npos)
            break;
    }
    if (size() % 2 != 0 && end_ < end && isUTF16())
        ++end_;
}
