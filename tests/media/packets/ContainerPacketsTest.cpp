// Containers that list their packets: MP4, MOV and CAF, as programs write them and with modifications.
#include "media/packets/EncodedFiles.h"

#include "platform/core/ByteWriter.h"
#include "platform/core/Status.h"
#include "support/Hex.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>

#include <sys/resource.h>

using namespace platform;

namespace {

constexpr Sound kSound{.frames = 20000};
constexpr std::int32_t kOther = AudioHandle::kFormatNotSupported;

std::string aacInMP4()
{
    return encoded("ffmpeg -y -i IN -c:a aac -movflags +faststart OUT", "m4a", kSound);
}

/// Position of the body of the box of that type, which occurs once in these files.
std::size_t bodyOf(const Bytes& file, std::string_view type)
{
    const std::size_t at = textOf(file).find(type);
    EXPECT_NE(at, std::string_view::npos) << type;
    return at + 4;
}

template <class T>
void put(Bytes& file, std::string_view box, std::size_t offset, T value)
{
    storeBE(file.data() + bodyOf(file, box) + offset, value);
}

void rename(Bytes& file, std::string_view from, std::string_view to)
{
    std::ranges::copy(bytesOf(to), file.begin() + static_cast<std::ptrdiff_t>(bodyOf(file, from)) - 4);
}

Bytes box(std::string_view type, BytesView body)
{
    ByteWriter out;
    out.write(static_cast<std::uint32_t>(8 + body.size()));
    out.write(bytesOf(type));
    out.write(body);
    return out.take();
}

/// Puts a gapless item into the movie box, the last one in the file, in place of its other tags and most of its edits.
void addGaplessItem(Bytes& file, std::string_view value, std::string_view name = "exampleSMPB", bool keepsEdits = false)
{
    const auto field = [](std::string_view type, std::size_t zeros, std::string_view content) {
        ByteWriter body;
        body.writeZeros(zeros);
        body.write(bytesOf(content));
        return box(type, body.view());
    };
    ByteWriter item;
    item.write(field("mean", 4, "com.example"));
    item.write(field("name", 4, name));
    item.write(field("data", 8, value));
    ByteWriter meta;
    meta.writeZeros(4);
    meta.write(box("ilst", box("----", item.view())));
    const Bytes userData = box("udta", box("meta", meta.view()));
    rename(file, "udta", "free");
    if (!keepsEdits)
        rename(file, "edts", "free");
    const std::size_t movie = bodyOf(file, "moov") - 8;
    file.insert(file.end(), userData.begin(), userData.end());
    storeBE(file.data() + movie, static_cast<std::uint32_t>(file.size() - movie));
}

struct CAF {
    std::string id = "aac ";
    std::uint32_t bytesPerPacket = 0, framesPerPacket = 1024;
    Bytes cookie = {}, table = {}, data = {};
    std::int64_t dataSize = -2; // -2: as it is

    Bytes file() const
    {
        ByteWriter out;
        const auto chunk = [&](std::string_view type, std::int64_t size, BytesView body) {
            out.write(bytesOf(type));
            out.write(size);
            out.write(body);
        };
        ByteWriter description;
        description.write(44100.0);
        description.write(bytesOf(id));
        description.write(std::uint32_t{0});
        description.write(bytesPerPacket);
        description.write(framesPerPacket);
        description.write(std::uint32_t{2});
        description.write(std::uint32_t{0});
        ByteWriter content;
        content.write(std::uint32_t{0}); // edits
        content.write(data);
        out.write(bytesOf("caff"));
        out.write(std::uint32_t{0x10000});
        chunk("desc", static_cast<std::int64_t>(description.size()), description.view());
        chunk("kuki", static_cast<std::int64_t>(cookie.size()), cookie);
        if (!table.empty())
            chunk("pakt", static_cast<std::int64_t>(table.size()), table);
        chunk("data", dataSize == -2 ? static_cast<std::int64_t>(content.size()) : dataSize, content.view());
        return out.take();
    }
};

Bytes packetTable(std::int64_t packets, std::int64_t valid, std::int32_t priming, const std::vector<std::size_t>& sizes)
{
    ByteWriter out;
    out.write(packets);
    out.write(valid);
    out.write(priming);
    out.write(std::int32_t{0});
    for (const std::size_t size : sizes) {
        out.write(static_cast<std::uint8_t>(0x80 | size >> 14));
        out.write(static_cast<std::uint8_t>(0x80 | (size >> 7 & 0x7F)));
        out.write(static_cast<std::uint8_t>(size & 0x7F));
    }
    return out.take();
}

/// The packets of the AAC file as a CAF file.
CAF cafOf(PacketSource& source)
{
    CAF caf;
    std::vector<std::size_t> sizes;
    Bytes packet;
    for (std::uint64_t i = 0; i < source.packetCount() && source.read(i, packet) == 0; ++i)
        sizes.push_back(packet.size());
    caf.cookie.assign(source.cookie().begin(), source.cookie().end());
    caf.table = packetTable(static_cast<std::int64_t>(sizes.size()), 20000, 1024, sizes);
    caf.data = allPackets(source);
    return caf;
}

long peakMemory()
{
    rusage usage = {};
    getrusage(RUSAGE_SELF, &usage);
    return usage.ru_maxrss;
}

} // namespace

// Offsets are those of a box's fields (ISO/IEC 14496-12).
TEST(ContainerPackets, ofMP4AreTakenOnlyWhenTheyAreCountedExactly)
{
    // 21 packets of 1,024 frames: 2,112 frames are priming and 192 fill the last one.
    constexpr std::string_view fitting = " 00000000 00000840 000000C0 0000000000004B00 00000000 00000000";
    const struct {
        const char* name;
        std::function<void(Bytes&)> change;
        std::int32_t status;
        std::int64_t valid = 0;
        std::int32_t priming = 0;
    } cases[] = {
        {"unchanged", [](Bytes&) {}, 0, 20000, 1024},
        {"an edit that ends ahead of the end", [](Bytes& file) { put(file, "elst", 8, 100); }, 0, 4410, 1024},
        {"an edit that begins later", [](Bytes& file) { put(file, "elst", 12, 2112); }, 0, 18912, 2112},
        {"an edit behind the end", [](Bytes& file) { put(file, "elst", 12, 99999); }, 0, 0, 99999},
        {"an edit of silence", [](Bytes& file) { put(file, "elst", 12, -1); }, kOther},
        {"no edits", [](Bytes& file) { rename(file, "edts", "free"); }, 0, 21024, 0},
        {"a gapless item", [&](Bytes& file) { addGaplessItem(file, fitting); }, 0, 0x4B00, 0x840},
        {"of a last packet that is short",
         [](Bytes& file) { addGaplessItem(file, " 00000000 00000840 00000000 0000000000004B00 00000000"); }, 0, 0x4B00,
         0x840},
        {"of another name", [&](Bytes& file) { addGaplessItem(file, fitting, "exampleSMPBs"); }, 0, 21024, 0},
        {"beside an edit list", [&](Bytes& file) { addGaplessItem(file, fitting, "exampleSMPB", true); }, 0, 20000,
         1024},
        {"that says too much",
         [](Bytes& file) { addGaplessItem(file, " 00000000 00000840 00000123 0000000000014BCD 00000000"); }, 0, 21024,
         0},
        {"that says too little",
         [](Bytes& file) { addGaplessItem(file, " 00000000 00000840 00000000 0000000000004000 00000000"); }, 0, 21024,
         0},
        {"that is no number", [](Bytes& file) { addGaplessItem(file, "gapless"); }, 0, 21024, 0},
        {"another timescale", [](Bytes& file) { put(file, "mdhd", 12, 48000); }, kOther},
        {"packets of differing duration", [](Bytes& file) { put(file, "stts", 12, 1000); }, kOther},
        {"fewer durations than packets", [](Bytes& file) { put(file, "stts", 4, 1); }, kStatusIOError},
        {"2^32 - 1 packets", [](Bytes& file) { put(file, "stsz", 8, 0xFFFFFFFF); }, kStatusIOError},
        {"packets beyond the end", [](Bytes& file) { put(file, "stco", 8, 0xFFFFFFFF); }, 0, 0, 1024},
        {"too few packets in the chunks", [](Bytes& file) { put(file, "stsc", 12, 3); }, kStatusIOError},
        {"a second coding", [](Bytes& file) { put(file, "stsc", 16, 2); }, kOther},
        {"replicated bands, said ahead", [](Bytes& file) { put(file, "esds", 35, std::uint8_t{0x2A}); }, kOther},
        {"no descriptor", [](Bytes& file) { rename(file, "esds", "free"); }, kStatusIOError},
        {"another coding", [](Bytes& file) { rename(file, "mp4a", "ac-3"); }, kOther},
        {"a coding that nobody decodes", [](Bytes& file) { rename(file, "mp4a", "drms"); }, 0, 21024, 0},
    };
    const TemporaryFolder folder;
    const Bytes original = readFile(encoded("ffmpeg -y -i IN -c:a aac OUT", "m4a", kSound));
    for (const auto& expected : cases) {
        SCOPED_TRACE(expected.name);
        Bytes file = original;
        expected.change(file);
        const std::string path = folder.write("file", file);
        EXPECT_EQ(refusal(path), expected.status);
        if (expected.status != 0)
            continue;
        EXPECT_EQ(opened(path)->table().validFrames, expected.valid);
        EXPECT_EQ(opened(path)->table().primingFrames, expected.priming);
    }
}

// Box forms for files beyond 4 GiB.
TEST(ContainerPackets, ofMP4AreFoundByBoxesOfOtherWidths)
{
    const std::string path = encoded("ffmpeg -y -i IN -c:a aac OUT", "m4a", kSound);
    const Bytes original = readFile(path);
    const auto source = opened(path);
    ASSERT_TRUE(source);
    const struct {
        const char* name;
        std::function<void(Bytes&)> change;
    } cases[] = {
        {"offsets of 64 bits",
         [](Bytes& file) {
             std::byte* const body = file.data() + bodyOf(file, "stco");
             ASSERT_EQ(loadBE<std::uint32_t>(body + 4), 1U);
             storeBE(body - 8, loadBE<std::uint32_t>(body - 8) + loadBE<std::uint32_t>(body + 12)); // and the next box
             storeBE(body + 8, std::uint64_t{loadBE<std::uint32_t>(body + 8)});
             rename(file, "stco", "co64");
         }},
        {"data of a size of 64 bits",
         [](Bytes& file) {
             const std::size_t at = bodyOf(file, "free") - 8; // 8 bytes, ahead of the data
             const std::uint64_t size = loadBE<std::uint32_t>(file.data() + at + 8) + 8;
             storeBE(file.data() + at, std::uint32_t{1});
             storeBE(file.data() + at + 4, fourCC("mdat"));
             storeBE(file.data() + at + 8, size);
         }},
        {"a movie that reaches to the end of the file",
         [](Bytes& file) { storeBE(file.data() + bodyOf(file, "moov") - 8, std::uint32_t{0}); }},
        {"a movie of a size of 64 bits",
         [](Bytes& file) {
             const std::size_t body = bodyOf(file, "moov"); // the last box: no offset points behind its header
             const std::uint64_t size = loadBE<std::uint32_t>(file.data() + body - 8) + 8;
             storeBE(file.data() + body - 8, std::uint32_t{1});
             file.insert(file.begin() + static_cast<std::ptrdiff_t>(body), 8, std::byte{});
             storeBE(file.data() + body, size);
         }},
    };
    const TemporaryFolder folder;
    for (const auto& expected : cases) {
        SCOPED_TRACE(expected.name);
        Bytes file = original;
        expected.change(file);
        EXPECT_NE(file, original);
        const auto found = opened(folder.write("file", file));
        ASSERT_TRUE(found);
        EXPECT_EQ(allPackets(*found), allPackets(*source));
        EXPECT_EQ(found->table().validFrames, 20000);
    }
}

// "stz2" has packet sizes of 4, 8 or 16 bits, where "stsz" has 32.
TEST(ContainerPackets, ofMP4HaveSizesInFewerBits)
{
    const TemporaryFolder folder;
    const Bytes original = readFile(encoded("ffmpeg -y -i IN -c:a aac OUT", "m4a", kSound));
    const auto count = loadBE<std::uint32_t>(original.data() + bodyOf(original, "stsz") + 8);
    ASSERT_EQ(count % 2, 1U); // so that the last byte of 4-bit sizes holds one
    for (const auto bits : {std::uint8_t{4}, std::uint8_t{8}, std::uint8_t{16}}) {
        SCOPED_TRACE(int{bits});
        const auto sizeOf = [&](std::uint32_t i) { return bits == 16 ? 250 + i : i * 7 % ((1U << bits) - 1) + 1; };
        Bytes wide = original, compact = original;
        rename(compact, "stsz", "stz2");
        std::byte* const sizes = compact.data() + bodyOf(compact, "stz2") + 12;
        sizes[-5] = std::byte{bits};
        std::fill_n(sizes, 4 * count, std::byte{});
        for (std::uint32_t i = 0; i < count; ++i) {
            put(wide, "stsz", 12 + 4 * i, sizeOf(i));
            if (bits == 16)
                storeBE(sizes + 2 * i, static_cast<std::uint16_t>(sizeOf(i)));
            else
                sizes[i * bits / 8] |= static_cast<std::byte>(sizeOf(i) << (bits == 4 && i % 2 == 0 ? 4 : 0));
        }
        const auto expected = opened(folder.write("wide", wide)), found = opened(folder.write("compact", compact));
        ASSERT_TRUE(expected && found);
        EXPECT_EQ(found->packetCount(), count);
        EXPECT_EQ(allPackets(*found), allPackets(*expected));
        put(compact, "stz2", 8, count * 32U / bits + 1); // a packet more than the box has room for
        EXPECT_EQ(refusal(folder.write("compact", compact)), kStatusIOError);
        put(compact, "stz2", 8, count);
        for (const auto other : {std::uint8_t{0}, std::uint8_t{7}, std::uint8_t{32}}) {
            put(compact, "stz2", 7, other);
            EXPECT_EQ(refusal(folder.write("compact", compact)), kStatusIOError) << int{other};
        }
    }
}

TEST(ContainerPackets, ofADTSHaveAConfigurationThatSaysThatNoBandsAreReplicated)
{
    const auto source = opened(encoded("ffmpeg -y -i IN -c:a aac OUT", "aac", kSound));
    ASSERT_TRUE(source);
    const BytesView cookie = source->cookie();
    EXPECT_EQ(Bytes(cookie.begin(), cookie.end()), fromHex("1210 56e500")); // ISO/IEC 14496-3: AudioSpecificConfig
}

TEST(ContainerPackets, ofCAF)
{
    const auto source = opened(aacInMP4());
    ASSERT_TRUE(source);
    const Bytes packets = allPackets(*source);
    const CAF sound = cafOf(*source);
    const Bytes movie = readFile(aacInMP4());
    const auto descriptor = movie.begin() + static_cast<std::ptrdiff_t>(bodyOf(movie, "esds")) + 4;
    // With these flags (ISO/IEC 14496-1: ES_Descriptor) and that many bytes for what they announce; the address has 3.
    const auto fullDescriptor = [&](std::uint8_t flags, std::size_t more) {
        Bytes cookie(descriptor, descriptor + 42);
        cookie[4] = static_cast<std::byte>(std::to_integer<std::size_t>(cookie[4]) + more); // its size, of 4 bytes
        cookie[7] = std::byte{flags};
        Bytes fields(more);
        if ((flags & 0x40) != 0)
            fields[(flags & 0x80) != 0 ? 2 : 0] = std::byte{3};
        cookie.insert(cookie.begin() + 8, fields.begin(), fields.end());
        return cookie;
    };
    // Tag 3: id, flags; tag 4: coding, stream type and rates; tag 5: the configuration.
    constexpr std::string_view kShortDescriptor = "0316 000100 0411 40 15000000 00000000 00000000 0502 1210";
    const auto alac = [](CAF& caf, const std::string& bits, const std::string& channels) {
        caf.id = "alac";
        caf.cookie = fromHex("00000400 00" + bits + "280a0e" + channels + "00ff 00000000 00000000 0000ac44");
    };
    const struct {
        const char* name;
        std::function<void(CAF&)> change;
        std::int32_t status;
        std::uint64_t packets = 0;
        std::int64_t valid = 0;
    } cases[] = {
        {"a bare configuration", [](CAF&) {}, 0, 21, 20000},
        {"a descriptor", [&](CAF& caf) { caf.cookie.assign(descriptor, descriptor + 42); }, 0, 21, 20000},
        {"a descriptor with all that it may have", [&](CAF& caf) { caf.cookie = fullDescriptor(0xE0, 8); }, 0, 21,
         20000},
        {"a descriptor that depends on another", [&](CAF& caf) { caf.cookie = fullDescriptor(0x80, 2); }, 0, 21, 20000},
        {"a descriptor with an address", [&](CAF& caf) { caf.cookie = fullDescriptor(0x40, 4); }, 0, 21, 20000},
        {"a descriptor with a clock", [&](CAF& caf) { caf.cookie = fullDescriptor(0x20, 2); }, 0, 21, 20000},
        {"a descriptor of sizes in a byte each", [&](CAF& caf) { caf.cookie = fromHex(kShortDescriptor); }, 0, 21,
         20000},
        {"a rate in full", [](CAF& caf) { caf.cookie = fromHex("1780 5622 10"); }, 0, 21, 20000},
        {"channels by the packets", [](CAF& caf) { caf.cookie = fromHex("1200"); }, kOther},
        {"channels of a reserved number", [](CAF& caf) { caf.cookie = fromHex("1240"); }, kOther},
        {"a core coder", [](CAF& caf) { caf.cookie = fromHex("1212"); }, kOther},
        {"an extension", [](CAF& caf) { caf.cookie = fromHex("1211"); }, kOther},
        {"a configuration cut short", [](CAF& caf) { caf.cookie = fromHex("12"); }, kOther},
        {"ALAC", [&](CAF& caf) { alac(caf, "10", "02"); }, 0, 21, 20000},
        {"ALAC of 20 bits, 8 channels", [&](CAF& caf) { alac(caf, "14", "08"); }, 0, 21, 20000},
        {"ALAC of 17 bits", [&](CAF& caf) { alac(caf, "11", "02"); }, kStatusIOError},
        {"ALAC of no channels", [&](CAF& caf) { alac(caf, "18", "00"); }, kStatusIOError},
        {"ALAC of 9 channels", [&](CAF& caf) { alac(caf, "20", "09"); }, kStatusIOError},
        {"data cut short", [&](CAF& caf) { caf.data.resize(packets.size() - 1); }, 0, 20, 20 * 1024 - 1024},
        {"no table", [](CAF& caf) { caf.table.clear(); }, kStatusIOError},
        {"no cookie", [](CAF& caf) { caf.cookie.clear(); }, kStatusIOError},
        {"2^40 packets", [](CAF& caf) { storeBE(caf.table.data(), std::int64_t{1} << 40); }, kStatusIOError},
        {"2^40 frames", [](CAF& caf) { storeBE(caf.table.data() + 8, std::int64_t{1} << 40); }, 0, 21, 20 * 1024},
        {"a size without an end", [](CAF& caf) { caf.table.back() = std::byte{0x80}; }, kStatusIOError},
        {"frames that differ", [](CAF& caf) { caf.framesPerPacket = 0; }, kOther},
        {"frames that the cookie contradicts", [](CAF& caf) { caf.framesPerPacket = 960; }, kOther},
        {"packets of one size",
         [](CAF& caf) {
             caf = {.id = "ima4", .bytesPerPacket = 68, .framesPerPacket = 64, .data = Bytes(68 * 3 + 9)};
             caf.table = packetTable(3, 150, 0, {});
         },
         0, 3, 150},
        {"packets of an impossible size",
         [](CAF& caf) { caf = {.id = "ima4", .bytesPerPacket = 0xFFFFFFFF, .framesPerPacket = 64, .data = Bytes(9)}; },
         kOther},
    };
    const TemporaryFolder folder;
    for (const auto& expected : cases) {
        SCOPED_TRACE(expected.name);
        CAF caf = sound;
        expected.change(caf);
        const std::string path = folder.write("file", caf.file());
        EXPECT_EQ(refusal(path), expected.status);
        if (expected.status != 0)
            continue;
        const auto found = opened(path);
        EXPECT_EQ(found->packetCount(), expected.packets);
        EXPECT_EQ(found->table().validFrames, expected.valid);
        const Bytes read = allPackets(*found);
        EXPECT_TRUE(std::equal(read.begin(), read.end(), caf.data.begin()));
    }
}

TEST(ContainerPackets, thatAreNotThereTakeNoMemory)
{
    const TemporaryFolder folder;
    const long before = peakMemory();
    Bytes file = readFile(encoded("ffmpeg -y -i IN -c:a aac OUT", "m4a", kSound));
    put(file, "stts", 8, 0xFFFFFFFE);
    put(file, "stsz", 4, 1); // all of a byte, and so many
    put(file, "stsz", 8, 0xFFFFFFFF);
    put(file, "stsc", 12, 0xFFFFFFFF);
    const auto source = opened(folder.write("file", file));
    ASSERT_TRUE(source);
    EXPECT_LE(source->packetCount(), file.size());
    CAF caf = {.id = "alac", .framesPerPacket = 4096, .table = packetTable(0xFFFFFFFF, 1, 0, {1, 2, 3})};
    EXPECT_EQ(refusal(folder.write("file", caf.file())), kStatusIOError);
    EXPECT_LT(peakMemory() - before, 100 * 1024); // KiB
}
