// MP4 files in which only a tag tells which frames are sound, as older encoders write them.
#include "audiofile/CAudioFileIO.h"

#include "platform/core/ByteWriter.h"
#include "platform/core/Status.h"
#include "support/Programs.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>

namespace {

Bytes box(std::string_view type, std::initializer_list<BytesView> parts)
{
    ByteWriter body, out;
    for (const BytesView part : parts)
        body.write(part);
    out.write(static_cast<std::uint32_t>(8 + body.size()));
    out.write(bytesOf(type));
    out.write(body.view());
    return out.take();
}

std::size_t typeOf(const Bytes& file, std::string_view type)
{
    const std::size_t at = textOf(file).find(type);
    EXPECT_NE(at, std::string_view::npos) << type;
    return at;
}

/// Rewrites the movie box, the last one in the file, with the gapless item in place of its edits.
void replaceEditsByGaplessItem(Bytes& file, std::string_view value)
{
    const Bytes zeros(8);
    const BytesView four = BytesView(zeros).first(4);
    const Bytes item = box("----", {box("mean", {four, bytesOf("com.example")}),
                                    box("name", {four, bytesOf("exampleSMPB")}), box("data", {zeros, bytesOf(value)})});
    const Bytes userData = box("udta", {box("meta", {four, box("ilst", {item})})});
    for (const std::string_view type : {"edts", "udta"})
        std::ranges::copy(bytesOf("free"), file.begin() + static_cast<std::ptrdiff_t>(typeOf(file, type)));
    const std::size_t movie = typeOf(file, "moov") - 4;
    file.insert(file.end(), userData.begin(), userData.end());
    storeBE(file.data() + movie, static_cast<std::uint32_t>(file.size() - movie));
}

std::vector<float> framesOf(const std::string& path)
{
    CAudioFileIO file;
    EXPECT_EQ(file.Open(CFileRef(path.c_str(), false), 0), kStatusOK);
    EXPECT_EQ(file.OpenDecoder(), kStatusOK);
    std::vector<float> samples(static_cast<std::size_t>(file.Info().frames * file.Info().channels));
    EXPECT_EQ(file.ReadFrames(samples.data(), 0, file.Info().frames), kStatusOK);
    return samples;
}

} // namespace

// The judge decodes the original file, with its edits: 1,024 frames of priming before 20,000.
TEST(Gapless, TheItemTakesPrimingAndPaddingOff)
{
    const TemporaryFolder folder;
    ASSERT_TRUE(runs(folder, "sox -r 44100 -n -c 2 -b 16 source.wav synth 1 sine 300:3000 tremolo 9 trim 0 20000s && "
                             "ffmpeg -i source.wav -c:a aac -b:a 192k made.m4a && "
                             "ffmpeg -i made.m4a -f f32le -c:a pcm_f32le judge"));
    Bytes file = readFile(folder / "made.m4a");
    replaceEditsByGaplessItem(file, " 00000000 00000400 000001E0 0000000000004E20 00000000 00000000");
    const std::vector<float> samples = framesOf(folder.write("gapless.m4a", file));
    const Bytes judged = readFile(folder / "judge");
    ASSERT_EQ(samples.size(), 40000U);
    ASSERT_GE(judged.size(), samples.size() * sizeof(float));
    float largest = 0, difference = 0;
    for (std::size_t i = 0; i < samples.size(); ++i) {
        float expected = 0;
        std::memcpy(&expected, judged.data() + i * sizeof expected, sizeof expected);
        largest = std::max(largest, std::abs(expected));
        difference = std::max(difference, std::abs(samples[i] - expected));
    }
    EXPECT_GT(largest, 0.5F);
    EXPECT_LT(difference, 1e-4F);
}
