#include "LoopFiles.h"

#include "loops/VireoLoopChunksManager.h"
#include "loops/tagging/Chunks.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/core/ByteWriter.h"

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <cstdlib>
#include <ctime>
#include <fstream>

namespace {

constexpr std::size_t kSampleBytes = 60 * 1024;

struct Chunk {
    const char (&id)[5];
    Bytes body;
};

void putChunk(ByteWriter& out, const Chunk& chunk)
{
    out.writeFourCC(fourCC(chunk.id));
    out.write(static_cast<std::uint32_t>(chunk.body.size()));
    out.write(chunk.body);
    out.writeZeros(chunk.body.size() & 1);
}

/// A container of `kLoopFileSize` bytes: the chunks, and an overview that fills it.
Bytes container(FourCC id, FourCC formType, std::endian order, const std::array<Chunk, kLoopChunks - 1>& chunks)
{
    ByteWriter out(order);
    out.writeFourCC(id);
    out.write(static_cast<std::uint32_t>(kLoopFileSize - 8));
    out.writeFourCC(formType);
    for (const Chunk& chunk : chunks)
        putChunk(out, chunk);
    putChunk(out, {"LGWV", Bytes(kLoopFileSize - out.size() - 8)});
    return out.take();
}

Bytes text(std::string_view characters)
{
    const BytesView bytes = bytesOf(characters);
    return {bytes.begin(), bytes.end()};
}

/// The title for programs that know no loops: an ID3v2.3 tag with one text frame.
Bytes titleInID3()
{
    ByteWriter out;
    out.write(bytesOf("ID3\x03"));
    out.writeZeros(5);
    out.write(static_cast<std::uint8_t>(11 + kLoopTitle.size())); // size of the frame, 7 bits
    out.write(bytesOf("TIT2"));
    out.write(static_cast<std::uint32_t>(1 + kLoopTitle.size()));
    out.writeZeros(3); // flags, encoding
    out.write(bytesOf(kLoopTitle));
    return out.take();
}

template <class Record>
void putRecord(ByteWriter& out, const Record& record)
{
    out.write(std::as_bytes(std::span(&record, 1)));
}

Bytes basicTagging()
{
    tagging::BasicTaggingChunk chunk;
    chunk.beatCount = 8;
    chunk.midiRootNote = 57;
    chunk.keyType = 1;
    chunk.signatureTop = 4;
    chunk.signatureBottom = 4;
    chunk.fileType = 1;
    tagging::SwapBasicTaggingChunkToBig(&chunk);
    ByteWriter out;
    putRecord(out, chunk);
    return out.take();
}

tagging::CategoryText categoryText(std::string_view characters)
{
    tagging::CategoryText field{};
    characters.copy(field.data(), field.size() - 1);
    return field;
}

Bytes categories()
{
    tagging::CategoryChunk chunk;
    chunk.instrumentType = categoryText("Drums");
    chunk.instrumentSubType = categoryText("Shaker");
    chunk.genre = categoryText("Electronic");
    chunk.descriptorCount = 4;
    tagging::SwapCategoryChunkToBig(&chunk);
    ByteWriter out;
    putRecord(out, chunk);
    for (const char* descriptor : {"Acoustic", "Dry", "Grooving", "Single"})
        putRecord(out, categoryText(descriptor));
    return out.take();
}

Bytes transients()
{
    constexpr int count = 10;
    ByteWriter out;
    tagging::TransientsChunk chunk;
    chunk.count = count;
    std::array<std::byte, sizeof chunk + count * sizeof(tagging::TransientRecord)> bytes{};
    std::memcpy(bytes.data(), &chunk, sizeof chunk);
    tagging::SwapBasicTransientsChunkToBig(reinterpret_cast<tagging::TransientsChunk*>(bytes.data()));
    out.write(bytes);
    return out.take();
}

} // namespace

Bytes waveLoop()
{
    ByteWriter format(std::endian::little);
    for (const int field : {1, 2, 44100, 0, 176400 & 0xFFFF, 176400 >> 16, 4, 16})
        format.write(static_cast<std::uint16_t>(field));
    return container(kRIFF, kWAVE, std::endian::little,
                     {{{"fmt ", format.take()},
                       {"LIST", Bytes(120)},
                       {"bext", Bytes(602)},
                       {"cue ", Bytes(28)},
                       {"data", Bytes(kSampleBytes)},
                       {"smpl", Bytes(60)},
                       {"inst", Bytes(7)},
                       {"basc", basicTagging()},
                       {"cate", categories()}}});
}

Bytes aiffLoop()
{
    ByteWriter format;
    format.write<std::uint16_t>(2);
    format.write<std::uint32_t>((kSampleBytes - 8) / 4);
    format.write<std::uint16_t>(16);
    format.write<std::uint16_t>(0x400E); // 44100 as an 80-bit extended float
    format.write<std::uint64_t>(0xAC44000000000000);
    return container(kFORM, kAIFF, std::endian::big,
                     {{{"COMM", format.take()},
                       {"NAME", text(kLoopTitle)},
                       {"ANNO", Bytes(500)},
                       {"ID3 ", titleInID3()},
                       {"SSND", Bytes(kSampleBytes)},
                       {"MARK", Bytes(2)},
                       {"trns", transients()},
                       {"basc", basicTagging()},
                       {"cate", categories()}}});
}

BenchFolder::BenchFolder()
{
    std::string pattern = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
    if (mkdtemp(pattern.data()) == nullptr)
        std::abort();
    path_ = pattern;
}

BenchFolder::~BenchFolder()
{
    std::filesystem::remove_all(path_);
}

std::string BenchFolder::write(const std::string& name, const Bytes& content) const
{
    const std::string path = path_ / name;
    std::ofstream file(path, std::ios::binary);
    file.write(reinterpret_cast<const char*>(content.data()), static_cast<std::streamsize>(content.size()));
    if (!file.flush())
        std::abort();
    return path;
}

bool openReadClose(const std::string& path)
{
    std::array<char, 16 * 1024> start;
    const int descriptor = open(path.c_str(), O_RDONLY | O_CLOEXEC);
    const ssize_t got = pread(descriptor, start.data(), start.size(), 0);
    return close(descriptor) == 0 && got == ssize_t{start.size()};
}

bool readLoopTags(const std::string& path)
{
    const VireoLoopChunkList chunks = VireoLoopChunks::Empty();
    const auto url =
        platform::URL::createWithFileSystemPath(platform::String::fromUTF8(path), platform::PathStyle::posix, false);
    VireoLoopChunksManager manager(url, platform::AudioFile::Permission::read);
    manager.readChunks(chunks);
    const auto& tags = static_cast<VireoLoopCombinedTaggingChunk&>(*chunks[1]).tags();
    const auto& transients = static_cast<VireoLoopTransientChunk&>(*chunks[2]).transients();
    return !tags.isEmpty() && !transients.isEmpty();
}

double cpuSeconds()
{
    timespec now{};
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}
