// Faults in containers: none in good files, one finding per fault.
#include "media/containers/ContainerCheck.h"

#include "media/AudioContainers.h"
#include "support/Hex.h"
#include "support/MemoryBytes.h"

#include <random>

using namespace platform;

namespace {

using Kind = ContainerFinding::Kind;

constexpr FourCC kWAVEFile = fourCC("WAVE"), kRF64File = fourCC("RF64"), kAIFFFile = fourCC("AIFF"),
                 kCAFFile = fourCC("caff");

std::vector<ContainerFinding> findingsOf(Bytes bytes, std::int32_t expected = kStatusOK)
{
    const MemoryBytes file(std::move(bytes));
    HeaderWindow window(file, file.length());
    std::vector<ContainerFinding> findings;
    EXPECT_EQ(checkContainer(window, findings), expected);
    return findings;
}

Chunks chunksOf(FourCC container, Chunks others = {})
{
    Chunks chunks{formatChunk(container), dataChunk(container)};
    chunks.insert(chunks.end(), others.begin(), others.end());
    return chunks;
}

std::string frames32(std::uint32_t frames)
{
    ByteWriter writer(std::endian::little);
    writer.write(frames);
    return std::string(textOf(writer.view()));
}

struct ContainerFault {
    Bytes file;
    Kind kind;
    const char* chunk;
    std::uint64_t offset, stated, found;
};

/// The file with `bytes` at `offset`.
Bytes with(Bytes file, std::size_t offset, std::string_view bytes)
{
    std::ranges::copy(bytesOf(bytes), file.begin() + static_cast<std::ptrdiff_t>(offset));
    return file;
}

Bytes cutTo(Bytes file, std::size_t length)
{
    file.resize(length);
    return file;
}

} // namespace

TEST(ContainerCheck, GoodContainersAreSilent)
{
    for (FourCC container : {kWAVEFile, kRF64File, kAIFFFile, kCAFFile}) {
        SCOPED_TRACE(fourCCText(container));
        const Chunks notes{{fourCC("note"), "odd"}, {fourCC("note"), "twice"}};
        EXPECT_TRUE(findingsOf(buildContainer(container, chunksOf(container))).empty());
        EXPECT_TRUE(findingsOf(buildContainer(container, chunksOf(container, notes))).empty());
    }
    // Legal: an open last chunk in CAF, samples before "COMM", a size without the last pad byte.
    Bytes caf = buildContainer(kCAFFile, chunksOf(kCAFFile));
    EXPECT_TRUE(findingsOf(with(caf, 56, std::string(8, '\xFF'))).empty());
    EXPECT_TRUE(findingsOf(buildContainer(kAIFFFile, {dataChunk(kAIFFFile), formatChunk(kAIFFFile)})).empty());
    Bytes odd = buildContainer(kWAVEFile, chunksOf(kWAVEFile, {{fourCC("note"), "odd"}}));
    EXPECT_TRUE(findingsOf(with(odd, 4, frames32(static_cast<std::uint32_t>(odd.size() - 9)))).empty());
}

TEST(ContainerCheck, OneFaultIsOneFinding)
{
    using namespace std::literals;
    const Bytes wave = buildContainer(kWAVEFile, chunksOf(kWAVEFile));   // "fmt " at 12, "data" at 36, 60 bytes
    const Bytes long64 = buildContainer(kRF64File, chunksOf(kRF64File)); // "ds64" at 12, "data" at 72
    const Bytes noted = buildContainer(kWAVEFile, chunksOf(kWAVEFile, {{fourCC("note"), "odd"}, {fourCC("last"), ""}}));
    const Bytes aiff = buildContainer(kAIFFFile, chunksOf(kAIFFFile)); // "COMM" at 12, "SSND" at 38
    const Chunks::value_type format = formatChunk(kWAVEFile), data = dataChunk(kWAVEFile);
    const Bytes late = buildContainer(kWAVEFile, {data, format});
    const Bytes behind =
        with(buildContainer(kWAVEFile, chunksOf(kWAVEFile, {{fourCC("note"), "even"}})), 4, frames32(52));
    const Bytes out = with(wave, 4, frames32(48));
    const Bytes padless = [&] {
        Bytes file = noted;
        file.erase(file.begin() + 71);
        return with(file, 4, frames32(static_cast<std::uint32_t>(file.size() - 8)));
    }();
    const ContainerFault faults[] = {
        {behind, Kind::chunkBehind, "note", 60, 60, 0},
        {[&] {
             Bytes file = wave;
             const BytesView more = bytesOf("TAG of ID3, not a chunk"sv);
             file.insert(file.end(), more.begin(), more.end());
             return file;
         }(),
         Kind::bytesBehind, "RIFF", 60, 60, 23},
        {buildContainer(kWAVEFile, chunksOf(kWAVEFile, {{fourCC("bext"), std::string(601, 'x')}})), Kind::chunkIsShort,
         "bext", 60, 602, 601},
        {buildContainer(kWAVEFile, chunksOf(kWAVEFile, {{fourCC("a\x7F  "), ""}})), Kind::idIsNoName, "a\\x7F  ", 60, 0,
         0},
        {buildContainer(kWAVEFile, chunksOf(kWAVEFile, {{fourCC("LIST"), "INFOINAM\4\0\0\0odd"s}})),
         Kind::chunkReachesOut, "INAM", 72, 83, 84},
        {buildContainer(kWAVEFile, chunksOf(kWAVEFile, {{fourCC("LIST"), "INFOINAM\3\0\0\0oddIART\2\0\0\0me"s}})),
         Kind::padIsMissing, "INAM", 72, 0, 3},
        {with(wave, 28, "\7"s), Kind::byteRateDiffers, "fmt ", 12, 88071, 88200},
        {with(wave, 20, "\x55"s), Kind::factIsMissing, "fact", 0, 0, 0}, // MP3
        {with(long64, 44, "\2"s), Kind::tableIsShort, "ds64", 12, 2, 0},
        {with(long64, 4, frames32(91)), Kind::sizes64Differ, "RF64", 0, 91, 88},
        {with(wave, 40, frames32(20)), Kind::chunkIsCut, "data", 36, 20, 16},
        {with(wave, 4, "\0\0\0\0"s), Kind::sizeIsOpen, "RIFF", 0, 0, 52},
        {with(wave, 40, frames32(14)), Kind::noChunk, "RIFF", 58, 0, 2},
        {with(noted, 71, "\1"s), Kind::padIsNotZero, "note", 71, 0, 1},
        {padless, Kind::padIsMissing, "note", 60, 0, 3},
        {buildContainer(kWAVEFile, {format, format, data}), Kind::repeated, "fmt ", 36, 12, 0},
        {late, Kind::formatIsLate, "fmt ", 36, 0, 0},
        {buildContainer(kCAFFile, {{fourCC("note"), "x"}, formatChunk(kCAFFile), dataChunk(kCAFFile)}),
         Kind::formatIsLate, "desc", 21, 0, 0},
        {buildContainer(kWAVEFile, {data}), Kind::formatIsMissing, "fmt ", 0, 0, 0},
        {with(wave, 22, "\0\0"s), Kind::formatIsWrong, "fmt ", 12, 0, 0},
        {buildContainer(kWAVEFile, {format}), Kind::soundIsMissing, "data", 0, 0, 0},
        {buildContainer(kWAVEFile, {format, {fourCC("data"), "odd"}}), Kind::soundIsUneven, "data", 36, 2, 1},
        {buildContainer(kWAVEFile, {format, {fourCC("fact"), frames32(9)}, data}), Kind::framesDiffer, "fact", 36, 9,
         8},
        {with(aiff, 46, "\0\1\0\0"s), Kind::offsetIsWrong, "SSND", 38, 65536, 16},
        {with(buildContainer(kCAFFile, chunksOf(kCAFFile)), 56, std::string(7, '\xFF') + '\xFE'), Kind::sizeIsOpen,
         "data", 52, 0, 20},
        {with(aiff, 22, "\0\0\0\7"s), Kind::framesDiffer, "COMM", 12, 7, 8},
        {with(aiff, 22, "\0\0\0\0"s), Kind::countIsOpen, "COMM", 12, 0, 8},
        {with(long64, 36, "\7"s), Kind::framesDiffer, "ds64", 12, 7, 8},
        {with(wave, 0, "RF64"s), Kind::sizes64AreMissing, "RF64", 0, 0, 0},
        {with(long64, 76, frames32(14)), Kind::sizes64Differ, "data", 72, 14, 16},
    };
    for (const ContainerFault& fault : faults) {
        const std::vector<ContainerFinding> found = findingsOf(fault.file);
        SCOPED_TRACE(fault.chunk + std::to_string(static_cast<int>(fault.kind)));
        ASSERT_FALSE(found.empty());
        EXPECT_EQ(found[0].kind, fault.kind) << static_cast<int>(found[0].kind);
        EXPECT_EQ(fourCCText(found[0].chunk), fault.chunk);
        EXPECT_EQ(found[0].offset, fault.offset);
        EXPECT_EQ(found[0].stated, fault.stated);
        EXPECT_EQ(found[0].found, fault.found);
        EXPECT_EQ(found.size(), fault.kind == Kind::sizes64Differ ? 2u : 1u); // the surplus or the gap is reported too
    }
    // These faults entail others.
    const auto kindsOf = [](const Bytes& file) {
        std::vector<Kind> kinds;
        for (const ContainerFinding& finding : findingsOf(file))
            kinds.push_back(finding.kind);
        return kinds;
    };
    EXPECT_EQ(kindsOf(cutTo(wave, 52)), (std::vector{Kind::containerIsCut, Kind::chunkIsCut}));
    EXPECT_EQ(kindsOf(out), (std::vector{Kind::chunkReachesOut, Kind::bytesBehind}));
    EXPECT_EQ(kindsOf(with(late, 4, frames32(28))), // the format is searched for beyond
              (std::vector{Kind::chunkBehind, Kind::formatIsLate}));
}

TEST(ContainerCheck, NoBytesLeadAstray)
{
    EXPECT_TRUE(findingsOf({}, kStatusParameterError).empty());
    EXPECT_TRUE(findingsOf(Bytes(100), kStatusParameterError).empty());
    // If nothing is known about the sound, a nameless chunk is not its format, and nothing more.
    const Bytes rex2 = fromHex("43415420 0000001E 52455832 48454144 00000006 000000000000 00000000 00000003 00000000");
    ASSERT_EQ(findingsOf(rex2).size(), 1u);
    EXPECT_EQ(findingsOf(rex2)[0].kind, Kind::idIsNoName);
    std::mt19937 random(7);
    for (FourCC container : {kWAVEFile, kRF64File, kAIFFFile, kCAFFile}) {
        const Bytes whole = buildContainer(container, chunksOf(container, {{fourCC("note"), "odd"}}));
        for (std::size_t length = 16; length < whole.size(); ++length) {
            const std::vector<ContainerFinding> found = findingsOf(cutTo(whole, length));
            // CAF needs none of the notes.
            EXPECT_TRUE(!found.empty() || container == kCAFFile) << fourCCText(container) << length;
        }
        for (int i = 0; i < 2000; ++i) {
            Bytes mutant = whole;
            for (int k = 0; k < 4; ++k)
                mutant[random() % mutant.size()] = static_cast<std::byte>(random());
            const MemoryBytes file(mutant);
            HeaderWindow window(file, file.length());
            std::vector<ContainerFinding> findings;
            checkContainer(window, findings);
            for (const ContainerFinding& finding : findings)
                EXPECT_LE(finding.offset, mutant.size());
        }
        // A failed read is not an end.
        const MemoryBytes broken(whole, 40);
        HeaderWindow window(broken, broken.length());
        std::vector<ContainerFinding> findings;
        EXPECT_EQ(checkContainer(window, findings), kStatusIOError);
    }
}
