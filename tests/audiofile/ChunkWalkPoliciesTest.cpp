// The walk over any source of bytes: where its two policies agree and where they differ.
#include "media/containers/AudioDescription.h"

#include "support/ContainerBuilder.h"
#include "support/MemoryBytes.h"

#include <gtest/gtest.h>

#include <algorithm>

using namespace platform;

namespace {

/// Ids and sizes, then the position for one more chunk.
std::string walkOf(const MemoryBytes& file, WalkPolicy policy)
{
    HeaderWindow window(file, file.length());
    ChunkWalk walk(window, policy);
    if (const std::int32_t status = walk.begin(); status != kStatusOK)
        return "begin " + std::to_string(status);
    std::string text;
    std::int64_t end = 0;
    while (walk.next()) {
        const WalkedChunk& chunk = walk.chunk();
        text += (chunk.id != 0 ? fourCCText(chunk.id) : "zeros") + ":" +
                (chunk.size == INT64_MAX ? "open" : std::to_string(chunk.size)) + " ";
        end = walk.following();
    }
    if (policy == WalkPolicy::toTheSound)
        end = static_cast<std::int64_t>(walk.end());
    return text + (walk.isBroken() ? "broken " : "") +
           (walk.status() != kStatusOK ? "status " + std::to_string(walk.status()) : "at " + std::to_string(end));
}

Bytes with(Bytes content, std::size_t offset, std::string_view bytes)
{
    content.resize(std::max(content.size(), offset + bytes.size()));
    std::ranges::copy(bytesOf(bytes), content.begin() + static_cast<std::ptrdiff_t>(offset));
    return content;
}

} // namespace

TEST(ChunkWalkPolicies, DifferWhereTheySayAndNowhereElse)
{
    using namespace std::string_view_literals;
    const Bytes wave = ContainerBuilder("RIFF").format().chunk("note", "abc").chunk("data", "wxyz").bytes(); // 60 bytes
    const Bytes aiff = ContainerBuilder("FORM", "AIFF").format().chunk("SSND", std::string(8, 0) + "wxyz").bytes();
    const std::size_t end = wave.size(), aiffEnd = aiff.size();
    const struct {
        const char* what;
        Bytes content;
        std::string toTheSound, asStated;
    } cases[] = {
        {"whole", wave, "fmt :16 note:3 data:4 at " + std::to_string(end), ""},
        {"whole AIFF", aiff, "COMM:18 SSND:12 at " + std::to_string(aiffEnd), ""},
        {"size never filled in", with(wave, 4, "\0\0\0\0"sv), "fmt :16 note:3 data:4 at " + std::to_string(end),
         "fmt :16 at 36"},
        {"size that ends ahead of the samples", with(wave, 4, "\x24\0\0\0"sv),
         "fmt :16 note:3 data:4 broken at " + std::to_string(end), "fmt :16 note:3 at 48"},
        {"unfinished", with(with(wave, 4, "\0\0\0\0"sv), end - 8, "\0\0\0\0"sv),
         "fmt :16 note:3 data:open broken at " + std::to_string(end), "fmt :16 at 36"},
        {"size of 2 GiB", with(aiff, aiffEnd - 16, "\x80\0\0\0"sv),
         "COMM:18 SSND:2147483648 at " + std::to_string(aiffEnd),
         "COMM:18 SSND:-2147483648 at " + std::to_string(aiffEnd)},
        {"three stray bytes", with(with(wave, end, "abc"), 4, "\x3B\0\0\0"sv),
         "fmt :16 note:3 data:4 at " + std::to_string(end), "fmt :16 note:3 data:4 at " + std::to_string(end + 3)},
        {"zeros", with(with(wave, end, "\0\0\0\0\0\0\0\0"sv), 4, "\x40\0\0\0"sv),
         "fmt :16 note:3 data:4 broken at " + std::to_string(end),
         "fmt :16 note:3 data:4 zeros:0 at " + std::to_string(end + 8)},
        {"too short for a chunk", Bytes(wave.begin(), wave.begin() + 14), "at 12", "begin -50"},
    };
    for (const auto& each : cases) {
        const MemoryBytes file(each.content);
        EXPECT_EQ(walkOf(file, WalkPolicy::toTheSound), each.toTheSound) << each.what;
        EXPECT_EQ(walkOf(file, WalkPolicy::asStated), each.asStated.empty() ? each.toTheSound : each.asStated)
            << each.what;
    }
}

TEST(ChunkWalkPolicies, AFailedReadIsNoEnd)
{
    const Bytes content =
        ContainerBuilder("RIFF").format().chunk("data", std::string(9000, 'x')).chunk("note", "abc").bytes();
    for (const WalkPolicy policy : {WalkPolicy::toTheSound, WalkPolicy::asStated}) {
        const std::string text = walkOf(MemoryBytes(content, 9000), policy);
        EXPECT_NE(text.find("status -36"), std::string::npos) << text;
        EXPECT_EQ(text.find("note"), std::string::npos) << text;
        EXPECT_EQ(walkOf(MemoryBytes(content, 0), policy), "begin -36");
    }
}
