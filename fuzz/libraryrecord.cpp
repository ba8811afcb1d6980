// A line of records from another machine, from any bytes: what is taken is written again as the same record, byte by
// byte the second time.
#include "tool/shared/library/LibraryRecordCheck.h"
#include "tool/shared/library/LibraryRecordJson.h"
#include "tool/shared/output/Failure.h"

#include <cstdlib>

namespace {

void require(bool holds)
{
    if (!holds)
        std::abort();
}

std::string written(const LibraryRecord& record)
{
    JsonWriter json;
    writeLibraryRecord(json, record);
    return std::string(json.text());
}

std::string written(const LibraryRoot& root)
{
    JsonWriter json;
    writeLibraryRoot(json, root);
    return std::string(json.text());
}

void requireSame(const LibraryRecord& one, const LibraryRecord& other)
{
    require(one.place == other.place && one.stamp == other.stamp && one.indexed == other.indexed);
    for (const LibraryColumn& column : libraryColumns())
        std::visit([&](const auto member) { require(one.*member == other.*member); }, column.member);
    require(one.problems.size() == other.problems.size());
    for (std::size_t i = 0; i < one.problems.size(); ++i)
        require(one.problems[i].kind == other.problems[i].kind && one.problems[i].text == other.problems[i].text);
    require(one.overview.has_value() == other.overview.has_value());
    require(!one.overview || (one.overview->framesPerPoint == other.overview->framesPerPoint &&
                              one.overview->points == other.overview->points));
    require(one.fields == other.fields && one.tags == other.tags);
}

void requireSame(const LibraryRoot& one, const LibraryRoot& other)
{
    require(one.path == other.path && one.completed == other.completed);
}

template <class Kind>
void writeAgain(const Kind& read)
{
    const std::string text = written(read);
    const LibraryLine again = libraryLineOf(text);
    require(std::holds_alternative<Kind>(again));
    requireSame(read, std::get<Kind>(again));
    require(written(std::get<Kind>(again)) == text);
}

std::optional<LibraryLine> taken(std::string_view line)
{
    try {
        return libraryLineOf(line);
    } catch (const Failure&) {
        return std::nullopt;
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const auto line = taken({reinterpret_cast<const char*>(data), size});
    if (!line)
        return 0;
    if (const auto* const record = std::get_if<LibraryRecord>(&*line))
        writeAgain(*record);
    else if (const auto* const root = std::get_if<LibraryRoot>(&*line))
        writeAgain(*root);
    return 0;
}
