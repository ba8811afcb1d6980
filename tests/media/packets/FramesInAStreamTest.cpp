// Hand-made streams of frames without a table: foreign bytes around the frames, and damage between them.
#include "media/packets/EncodedFiles.h"

#include "platform/core/Packed.h"
#include "platform/core/Status.h"
#include "support/FaultInjection.h"

#include <gtest/gtest.h>

using namespace platform;

namespace {

/// Frame `number` of MPEG-1 layer III: 44.1 kHz, stereo, 417 bytes at 128 kbit/s unless the header says otherwise.
Bytes frame(std::uint32_t number, std::uint32_t header = 0xFFFB9064, std::size_t size = 417)
{
    Bytes bytes(size, std::byte{0x55});
    storeBE(bytes.data(), header);
    if (size >= 44)
        storeBE(bytes.data() + 40, number);
    return bytes;
}

/// As frame(), with 261 bytes at 80 kbit/s: assuming one length for all frames would lose many.
Bytes shortFrame(std::uint32_t number)
{
    return frame(number, 0xFFFB6064, 261);
}

/// An ADTS frame: AAC-LC, 44.1 kHz, stereo, `size` bytes including its header of 7.
Bytes adtsFrame(std::uint32_t number, std::uint32_t size = 200)
{
    Bytes bytes(size, std::byte{0x55});
    storeBE(bytes.data(), 0xFFF15080 | size >> 11);
    storeBE(bytes.data() + 4, static_cast<std::uint16_t>(size << 5 | 0x1F));
    bytes[6] = std::byte{0xFC};
    storeBE(bytes.data() + 40, number);
    return bytes;
}

Bytes frames(std::uint32_t first, std::uint32_t count)
{
    Bytes all;
    for (std::uint32_t i = first; i < first + count; ++i) {
        const Bytes next = i % 3 == 0 ? frame(i) : shortFrame(i);
        all.insert(all.end(), next.begin(), next.end());
    }
    return all;
}

Bytes operator+(Bytes a, const Bytes& b)
{
    a.insert(a.end(), b.begin(), b.end());
    return a;
}

Bytes text(std::string_view content)
{
    return {bytesOf(content).begin(), bytesOf(content).end()};
}

/// An ID3v2 tag of 10 + `size` bytes, filled with apparent headers.
Bytes leadingTag(std::uint32_t size)
{
    Bytes tag(10 + size, std::byte{0xFF});
    storeBE(tag.data(), fourCC("ID3\4"));
    storeBE(tag.data() + 4, std::uint16_t{0});
    storeBE(tag.data() + 6, (size & 0xFE00000) << 3 | (size & 0x1FC000) << 2 | (size & 0x3F80) << 1 | (size & 0x7F));
    return tag;
}

/// An APE tag of `size` bytes after its header, if it has one, with these flags in the footer.
Bytes trailingTag(std::uint32_t size, std::uint32_t flags, std::string_view id = "APETAGEX")
{
    Bytes tag(size + (flags >> 31) * 32, std::byte{0xFF});
    std::byte* const footer = tag.data() + tag.size() - 32;
    std::ranges::copy(bytesOf(id), footer);
    storeLE(footer + 8, std::uint32_t{2000});
    storeLE(footer + 12, size);
    storeLE(footer + 16, std::uint32_t{1});
    storeLE(footer + 20, flags);
    return tag;
}

/// A frame that describes the others: "Xing", frames and bytes, then LAME's fields with both numbers of padding.
Bytes infoFrame(std::uint32_t frameCount, std::uint32_t byteCount, std::uint32_t padding = 576 << 12 | 1000)
{
    Bytes bytes(417);
    storeBE(bytes.data(), 0xFFFB9064);
    storeBE(bytes.data() + 36, fourCC("Xing"));
    storeBE(bytes.data() + 40, std::uint32_t{3});
    storeBE(bytes.data() + 44, frameCount);
    storeBE(bytes.data() + 48, byteCount);
    storeBE(bytes.data() + 52, fourCC("LAME"));
    storeBE(bytes.data() + 73, padding << 8);
    return bytes;
}

/// The numbers in the packets, in order: "0 1 2".
std::string numbersIn(PacketSource& source)
{
    std::string numbers;
    Bytes packet;
    for (std::uint64_t i = 0; i < source.packetCount() && source.read(i, packet) == 0; ++i) {
        const std::size_t at = source.fileType() == fourCC("adts") ? 40 - 7 : 40;
        numbers +=
            (i > 0 ? " " : "") + (packet.size() > at + 4 ? std::to_string(loadBE<std::uint32_t>(&packet[at])) : "?");
    }
    return numbers;
}

} // namespace

TEST(FramesInAStream, areFoundWhateverStandsAroundThem)
{
    const Bytes few = frames(0, 4);
    const Bytes run = frames(0, 10);
    const Bytes junk(3000, std::byte{0xFF});
    const Bytes otherRate = frame(77, 0xFFFB9464, 384);  // 48 kHz
    const Bytes oneChannel = frame(78, 0xFFFB90C4, 417); // mono
    const Bytes otherLayer = frame(79, 0xFFFD9064, 417); // II
    const auto lastOf = [](const Bytes& tag) { return Bytes(tag.end() - 32, tag.end()); };
    const std::string four = "0 1 2 3";
    const std::string ten = "0 1 2 3 4 5 6 7 8 9";
    const struct {
        const char* name;
        Bytes file;
        std::string numbers;
    } cases[] = {
        {"nothing", few, four},
        {"two tags and zeros", leadingTag(100) + leadingTag(70000) + Bytes(5000) + few, four},
        {"an ID3v1 tag", few + text("TAG") + Bytes(125, std::byte{0xFF}), four},
        {"what is no APE tag", few + lastOf(trailingTag(700, 0, "APETAGEY")), four},
        {"an APE tag longer than the file", few + lastOf(trailingTag(7000, 0)), four},
        {"a frame cut off", few + Bytes(run.begin(), run.begin() + 300), four},
        {"junk ahead", junk + run, ten},
        {"junk within", frames(0, 3) + junk + frames(3, 7), ten},
        {"a tag within", frames(0, 3) + leadingTag(2000000) + frames(3, 7), ten},
        {"a single header within", frames(0, 3) + Bytes(100) + frame(66) + Bytes(100) + frames(3, 7), ten},
        {"other frames within", frames(0, 3) + otherRate + oneChannel + otherLayer + frames(3, 7), ten},
        {"more junk than is passed over", frames(0, 3) + Bytes(1100000) + frames(3, 7), "0 1 2"},
        {"too much junk ahead", Bytes(66000, std::byte{0xFF}) + run, ""},
        {"one frame", frame(0), "0"},
        {"two frames and something else", frame(0) + frame(1) + Bytes(600), "0 1"},
        {"one frame and something else", frame(0) + Bytes(600), ""},
        {"nothing at all", {}, ""},
        {"ADTS", leadingTag(300) + adtsFrame(0) + adtsFrame(1, 5000) + adtsFrame(2), "0 1 2"},
        {"ADTS with junk", adtsFrame(0) + adtsFrame(1, 5000) + junk + adtsFrame(2) + adtsFrame(3), "0 1 2 3"},
    };
    const TemporaryFolder folder;
    for (const auto& expected : cases) {
        SCOPED_TRACE(expected.name);
        const std::string path = folder.write("file", expected.file);
        if (expected.numbers.empty()) {
            EXPECT_EQ(refusal(path), AudioHandle::kFormatNotSupported);
            continue;
        }
        const auto source = opened(path);
        ASSERT_TRUE(source);
        EXPECT_EQ(numbersIn(*source), expected.numbers);
    }
}

TEST(FramesInAStream, theHeadersCountIsTakenWhenItAgreesWithTheFile)
{
    const Bytes ten = frames(0, 10);
    const auto bytes = static_cast<std::uint32_t>(417 + ten.size());
    const struct {
        const char* name;
        Bytes file;
        std::uint64_t packets;
        std::int64_t valid;
        std::int32_t priming, remainder;
    } cases[] = {
        {"agrees", infoFrame(10, bytes) + ten, 10, 11520 - 1105 - 471, 1105, 471},
        {"agrees, ahead of a tag", infoFrame(9, bytes) + ten + trailingTag(100, 0), 9, 10368 - 1105 - 471, 1105, 471},
        {"of a tag with a header", infoFrame(9, bytes) + ten + trailingTag(100, 1U << 31), 9, 10368 - 1105 - 471, 1105,
         471},
        {"of two tags", infoFrame(10, bytes) + ten + trailingTag(100, 1U << 30) + trailingTag(32, 0), 10,
         11520 - 1105 - 471, 1105, 471},
        {"fewer frames than the bytes are", infoFrame(2, bytes) + ten, 10, 11520 - 1105, 1105, 0},
        {"other bytes", infoFrame(9, bytes - 1) + ten, 10, 11520 - 1105, 1105, 0},
        {"frames that would not fit", infoFrame(0xFFFFFFFF, bytes) + ten, 10, 11520 - 1105, 1105, 0},
        {"cut short", infoFrame(10, bytes) + frames(0, 8), 8, 9216 - 1105, 1105, 0},
        {"little padding", infoFrame(10, bytes, 576 << 12 | 100) + ten, 10, 11520 - 1105, 1105, 0},
        {"more padding than sound", infoFrame(1, 417 + 417, 4095 << 12 | 4095) + frame(0), 1, 0, 4624, 3566},
        {"no frames", infoFrame(0, 417), 0, 0, 1105, 471},
    };
    const TemporaryFolder folder;
    for (const auto& expected : cases) {
        SCOPED_TRACE(expected.name);
        const auto source = opened(folder.write("file", expected.file));
        ASSERT_TRUE(source);
        EXPECT_EQ(source->packetCount(), expected.packets);
        EXPECT_EQ(source->table().validFrames, expected.valid);
        EXPECT_EQ(source->table().primingFrames, expected.priming);
        EXPECT_EQ(source->table().remainderFrames, expected.remainder);
    }
}

// The bits of a frame may begin 511 bytes back, in MPEG-2 255.
TEST(FramesInAStream, asManyPacketsAreDecodedAheadAsTheReservoirReaches)
{
    const struct {
        const char* name;
        Bytes frame;
        std::uint64_t ahead;
    } cases[] = {
        {"128 kbit/s: 381 bytes each", frame(0), 10},
        {"32 kbit/s at 48 kHz: 60 bytes each", frame(0, 0xFFFB1464, 96), 9 + 2},
        {"with a CRC: 58 bytes each", frame(0, 0xFFFA1464, 96), 9 + 2},
        {"8 kbit/s at 24 kHz, mono: 11 bytes each", frame(0, 0xFFF314C4, 24), 24 + 2},
        {"8 kbit/s at 24 kHz: 3 bytes each", frame(0, 0xFFF31464, 24), 85 + 2},
    };
    const TemporaryFolder folder;
    for (auto expected : cases) {
        SCOPED_TRACE(expected.name);
        Bytes file;
        for (int i = 0; i < 200; ++i)
            file.insert(file.end(), expected.frame.begin(), expected.frame.end());
        const auto source = opened(folder.write("file", file));
        ASSERT_TRUE(source);
        ASSERT_EQ(source->packetCount(), 200U);
        EXPECT_EQ(source->preRoll(0), 0U);
        EXPECT_EQ(source->preRoll(7), 7U);
        EXPECT_EQ(source->preRoll(150), expected.ahead);
    }
}

TEST(FramesInAStream, aFailingReadIsToldAndMayBeRepeated)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("file", frames(0, 60));
    EXPECT_EQ(refusal(folder / "missing"), kStatusFileNotFound);
    EXPECT_EQ(refusal(folder.path().string()), kStatusParameterError); // a folder
    FaultInjector faults;
    faults.fail(Call::pread, EIO);
    EXPECT_EQ(refusal(path), kStatusIOError);
    EXPECT_EQ(faults.calls(Call::close), 1);
    const std::string large = folder.write("large", frames(0, 1000));
    const auto source = opened(large);
    ASSERT_TRUE(source);
    Bytes packet;
    faults.fail(Call::pread, EIO);
    EXPECT_EQ(source->read(1, packet), kStatusIOError);
    EXPECT_EQ(source->read(1, packet), 0);
    EXPECT_EQ(packet, shortFrame(1));
}
