// Damaged files of every kind: each is refused, or has a table that its packets confirm.
#include "media/packets/EncodedFiles.h"

#include <gtest/gtest.h>

#include <random>

using namespace platform;

namespace {

/// Whether the file opens.
bool expectSound(const std::string& path, std::size_t fileSize)
{
    std::int32_t status = 0;
    const auto source = openPacketSource(path, &status);
    if (!source) {
        EXPECT_NE(status, 0);
        return false;
    }
    const PacketTable& table = source->table();
    EXPECT_GE(table.validFrames, 0);
    EXPECT_GE(table.primingFrames, 0);
    EXPECT_GE(table.remainderFrames, 0);
    EXPECT_LE(source->packetCount(), fileSize);
    Bytes packet;
    for (std::uint64_t i = source->packetCount(); i-- > 0;) { // backwards, unlike any reader
        EXPECT_LE(source->preRoll(i), i);
        if (source->read(i, packet) == 0) {
            EXPECT_LE(packet.size(), fileSize);
        }
    }
    EXPECT_NE(source->read(source->packetCount(), packet), 0);
    return true;
}

} // namespace

TEST(Mutants, areRefusedOrSound)
{
    const std::pair<const char*, const char*> codings[] = {
        {"lame --quiet IN OUT", "mp3"},
        {"lame --quiet -t -V4 IN OUT", "mp3"},
        {"ffmpeg -y -i IN -c:a aac OUT", "m4a"},
        {"ffmpeg -y -i IN -c:a alac -movflags +faststart OUT", "mov"},
        {"ffmpeg -y -i IN -c:a aac OUT", "aac"},
        {"ffmpeg -y -i IN -c:a alac OUT", "caf"},
        {"ffmpeg -y -i IN -c:a libmp3lame OUT", "caf"},
    };
    constexpr int kMutants = 300; // half of them damaged, half cut
    const TemporaryFolder folder;
    std::minstd_rand random(20);
    const auto below = [&](std::size_t end) { return std::uniform_int_distribution<std::size_t>(0, end - 1)(random); };
    for (const auto& [command, extension] : codings) {
        SCOPED_TRACE(std::string(command) + " " + extension);
        const Bytes original = readFile(encoded(command, extension, {.frames = 20000}));
        ASSERT_FALSE(original.empty());
        // There is more to damage in headers and tables than in packets.
        const std::size_t head = std::min<std::size_t>(original.size(), 1500);
        int opening = 0;
        for (int i = 0; i < kMutants && !::testing::Test::HasFailure(); ++i) {
            Bytes mutant = original;
            if (i % 2 == 0)
                mutant.resize(below(original.size()));
            else
                for (std::size_t flips = 1 + below(6); flips > 0; --flips) {
                    const std::size_t region = below(3);
                    const std::size_t at = region == 0   ? below(original.size())
                                           : region == 1 ? below(head)
                                                         : original.size() - 1 - below(head);
                    mutant[at] ^= std::byte{1} << below(8);
                }
            SCOPED_TRACE(i);
            opening += expectSound(folder.write("mutant", mutant), mutant.size());
        }
        EXPECT_GT(opening, 10); // otherwise only refusals were tested
    }
}
