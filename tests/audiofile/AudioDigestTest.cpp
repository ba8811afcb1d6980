// Digests of the sound: they cover only the samples.
#include "audiofile/AudioDigest.h"

#include "support/ContainerBuilder.h"
#include "support/Hex.h"

#include <gtest/gtest.h>

using platform::Digest;

namespace {

std::string digestOf(CAudioFileIO& file, Digest::Kind kind)
{
    Digest digest(kind);
    Digest* const digests[] = {&digest};
    const std::int32_t status = DigestAudio(file, file.Info(), digests);
    return status == kStatusOK ? toHex(digest.finish()) : std::to_string(status);
}

} // namespace

TEST(AudioDigest, SamplesAloneCount)
{
    // The sound is "abcd", whose digests are known.
    const auto plain = ContainerBuilder("RIFF").chunk("fmt ", waveFormat(1, 1, 8000, 2, 16)).chunk("data", "abcd");
    const auto noted = ContainerBuilder("RIFF")
                           .chunk("note", "odd")
                           .chunk("fmt ", waveFormat(1, 1, 8000, 2, 16))
                           .chunk("data", "abcd")
                           .chunk("last", "x");
    const auto caf = ContainerBuilder("caff")
                         .chunk("desc", cafDescription(8000, "lpcm", {2, 2, 1, 1, 16}))
                         .chunk("data", std::string_view("\0\0\0\0abcd", 8));
    for (const ContainerBuilder& container : {plain, noted, caf}) {
        MemoryAudioFile file(container.bytes());
        EXPECT_EQ(digestOf(file, Digest::Kind::md5), "e2fc714c4727ee9395f324cd2e7f331f");
        EXPECT_EQ(digestOf(file, Digest::Kind::sha256),
                  "88d4266fd4e6338d13b845fcf289579d209c897823b9217da3e161936f031589");
    }
    MemoryAudioFile empty(ContainerBuilder("RIFF").chunk("fmt ", waveFormat(1, 1, 8000, 2, 16)).bytes());
    EXPECT_EQ(digestOf(empty, Digest::Kind::md5), std::to_string(kStatusParameterError));

    MemoryAudioFile file(plain.bytes());
    EXPECT_EQ(DigestAudio(file, file.Info(), {}, [] { return false; }), kStatusUserCancelled);
    AudioFileInfo beyond = file.Info();
    beyond.dataSize = 5; // the file became shorter
    EXPECT_EQ(DigestAudio(file, beyond, {}), kStatusEndOfFile);
}

TEST(AudioDigest, FLACStatesItsOwn)
{
    const std::string md5 = "000102030405060708090a0b0c0d0e0f", lead = "664c6143 80000022" + std::string(36, '0');
    const auto stated = [](const std::string& digits) {
        MemoryAudioFile file(fromHex(digits));
        return toHex(StatedMD5(file));
    };
    EXPECT_EQ(stated(lead + md5), md5);
    EXPECT_EQ(stated(lead + std::string(32, '0')), "") << "not reckoned by the encoder";
    EXPECT_EQ(stated("664c6144" + (lead + md5).substr(8)), "");
    EXPECT_EQ(stated(lead), "");
}
