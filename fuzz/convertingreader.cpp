// The converting reader on any bytes, with the file in memory: three bytes choose the client's channels, its samples
// and the place of a read, the rest is the file. A read in the middle gives what the read of everything gives there.
#include "MemoryDisk.h"

#include "media/decoding/ConvertingReader.h"

namespace {

using namespace platform;

constexpr std::uint32_t kMaxFrames = 1 << 16;

std::vector<std::uint8_t> readFrom(ConvertingReader& reader, std::int64_t frame, std::uint32_t frames)
{
    const StreamDescription& client = reader.clientFormat();
    frames = std::min(frames, (std::uint32_t{1} << 24) / client.bytesPerFrame);
    std::vector<std::uint8_t> bytes(std::size_t{frames} * client.bytesPerFrame);
    AudioBuffer buffer{client.channelsPerFrame, static_cast<std::uint32_t>(bytes.size()), bytes.data()};
    if (reader.seek(frame) != 0 || reader.read(frames, {&buffer, 1}) != 0)
        std::abort(); // the file says no more than is there
    bytes.resize(buffer.byteSize);
    return bytes;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size < 3 || size > kLargestFile)
        return 0;
    useMemory();
    fileBytes.assign(data + 3, data + size);
    const auto reader = ConvertingReader::open(*fileURL(), nullptr);
    if (!reader)
        return 0;
    constexpr SampleFormat samples[] = {{.bits = 8},
                                        {.bits = 16},
                                        {.bits = 24, .order = std::endian::big},
                                        {.bits = 32},
                                        {.bits = 32, .isFloat = true},
                                        {.bits = 64, .isFloat = true}};
    const auto client =
        StreamDescription::packedPCM(reader->clientFormat().sampleRate, data[0] % 9u, samples[data[1] % 6]);
    const bool isTaken = reader->setClientFormat(client) == 0;
    if (isTaken != (data[0] % 9u != 0)) // no channels make no format; then the file's own stays
        std::abort();
    const std::vector<std::uint8_t> whole = readFrom(*reader, 0, kMaxFrames);
    const std::vector<std::uint8_t> part = readFrom(*reader, data[2], 300);
    const std::size_t start = std::min(std::size_t{data[2]} * reader->clientFormat().bytesPerFrame, whole.size());
    if (whole.size() - start < part.size() && whole.size() < (std::size_t{1} << 24) / 2)
        std::abort();
    const std::size_t common = std::min(part.size(), whole.size() - start);
    if (!std::equal(part.begin(), part.begin() + static_cast<std::ptrdiff_t>(common),
                    whole.begin() + static_cast<std::ptrdiff_t>(start)))
        std::abort();
    return 0;
}
