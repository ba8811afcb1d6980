// What the chunks of samplers say of a loop, from any bytes: values keep to their ranges, texts are UTF-8, and no list
// is longer than the bytes that it was read from. The first byte chooses the byte order; then for each chunk its kind,
// a size of two bytes and the body.
#include "loops/SamplerTags.h"
#include "platform/String.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>

namespace {

constexpr FourCC kIDs[] = {fourCC("acid"), fourCC("smpl"), fourCC("inst"), fourCC("cue "),
                           fourCC("LIST"), fourCC("MARK"), fourCC("INST"), fourCC("NAME"),
                           fourCC("AUTH"), fourCC("(c) "), fourCC("ANNO"), fourCC("none")};

void require(bool holds)
{
    if (!holds)
        std::abort();
}

bool isText(const std::string& text)
{
    return platform::String::fromUTF8(text).utf8() == text;
}

void check(const SamplerTags& tags, std::size_t size)
{
    require(!tags.rootNote || (tags.rootNote->value >= 1 && tags.rootNote->value <= 127));
    require(!tags.tempo || (std::isfinite(tags.tempo->value) && tags.tempo->value > 0));
    require(!tags.beats || tags.beats->value > 0);
    require(tags.signatureTop.has_value() == tags.signatureBottom.has_value());
    require(tags.loops.size() <= size / 6 && tags.markers.size() <= size / 6);
    for (const SamplerTags::Loop& loop : tags.loops)
        require(loop.firstFrame <= loop.lastFrame);
    for (const SamplerTags::Marker& marker : tags.markers)
        require(isText(marker.name));
    for (const SamplerTags::Text& text : tags.texts)
        require(!text.text.empty() && isText(text.text));
    for (const std::uint64_t frames : {0ULL, 1ULL, 44100ULL, ~0ULL})
        tags.describeLoop(frames);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size == 0)
        return 0;
    const std::endian order = (data[0] & 1) != 0 ? std::endian::big : std::endian::little;
    std::vector<SamplerTagChunk> chunks;
    for (std::size_t at = 1; size - at >= 3;) {
        const std::size_t length = std::min(data[at + 1] | std::size_t{data[at + 2]} << 8, size - at - 3);
        const auto* const body = reinterpret_cast<const std::byte*>(data) + at + 3;
        chunks.push_back({kIDs[data[at] % std::size(kIDs)], Bytes(body, body + length)});
        at += 3 + length;
    }
    check(SamplerTags::of(chunks, order), size);
    return 0;
}
