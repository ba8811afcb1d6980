// Audio containers built and walked by hand, without the library.
#pragma once

#include "media/userdata/AudioFileService.h"
#include "platform/core/ByteReader.h"
#include "platform/core/ByteWriter.h"
#include "support/TemporaryFolder.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

/// Ids and bodies in file order.
using Chunks = std::vector<std::pair<FourCC, std::string>>;

inline const std::string testSamples = "\1\2\3\4\5\6\7\10\11\12\13\14\15\16\17\20"; // 8 frames, mono, 16 bits

inline bool isCAF(FourCC container)
{
    return container == fourCC("caff");
}

inline std::endian orderOf(FourCC container)
{
    return container == fourCC("AIFF") || container == fourCC("AIFC") || isCAF(container) ? std::endian::big
                                                                                          : std::endian::little;
}

/// The chunk for 16-bit mono at 44100 Hz, and the one with the samples. For WAVE, RF64, AIFF and CAF.
inline Chunks::value_type formatChunk(FourCC container)
{
    ByteWriter writer(orderOf(container));
    if (isCAF(container)) {
        writer.write(44100.0);
        writer.writeFourCC(fourCC("lpcm"));
        for (std::uint32_t field : {0u, 2u, 1u, 1u, 16u})
            writer.write(field);
        return {fourCC("desc"), std::string(textOf(writer.view()))};
    }
    if (container == fourCC("AIFF")) {
        using namespace std::string_literals;
        return {fourCC("COMM"), "\0\1\0\0\0\10\0\20\x40\x0E\xAC\x44\0\0\0\0\0\0"s};
    }
    for (int field : {1, 1, 44100, 0, 22664, 1, 2, 16})
        writer.write(static_cast<std::uint16_t>(field));
    return {fourCC("fmt "), std::string(textOf(writer.view()))};
}

inline Chunks::value_type dataChunk(FourCC container)
{
    if (isCAF(container))
        return {fourCC("data"), std::string(4, '\0') + testSamples};
    if (container == fourCC("AIFF"))
        return {fourCC("SSND"), std::string(8, '\0') + testSamples};
    return {fourCC("data"), testSamples};
}

/// A whole file. "RF64" gets a "ds64", which alone states the sizes of the container and of "data".
inline Bytes buildContainer(FourCC container, const Chunks& chunks)
{
    const bool caf = isCAF(container), rf64 = container == fourCC("RF64");
    ByteWriter writer(orderOf(container));
    writer.writeFourCC(caf                                      ? container
                       : rf64                                   ? container
                       : orderOf(container) == std::endian::big ? fourCC("FORM")
                                                                : fourCC("RIFF"));
    writer.write(caf ? 0x00010000u : 0xFFFFFFFFu);
    if (!caf)
        writer.writeFourCC(orderOf(container) == std::endian::big ? container : fourCC("WAVE"));
    if (rf64) {
        writer.writeFourCC(fourCC("ds64"));
        writer.write(std::uint32_t{28});
        writer.writeZeros(28);
    }
    for (const auto& [id, body] : chunks) {
        const bool in64 = rf64 && id == fourCC("data");
        if (in64)
            writer.patch(28, std::uint64_t{body.size()});
        writer.writeFourCC(id);
        caf ? writer.write(std::uint64_t{body.size()})
            : writer.write(in64 ? 0xFFFFFFFFu : static_cast<std::uint32_t>(body.size()));
        writer.write(bytesOf(body));
        writer.writeZeros(caf ? 0 : body.size() & 1);
    }
    if (rf64)
        writer.patch(20, std::uint64_t{writer.size() - 8});
    else if (!caf)
        writer.patch(4, static_cast<std::uint32_t>(writer.size() - 8));
    return writer.take();
}

/// The chunks that a strict reader finds, without filler and "ds64". Every chunk must lie inside the container, and the
/// container inside the file; only filler may be cut off by the end of a CAF file.
inline Chunks walkContainer(BytesView bytes)
{
    Chunks found;
    const FourCC container = loadBE<FourCC>(bytes.data());
    const bool caf = isCAF(container), rf64 = container == fourCC("RF64");
    const std::endian order = container == fourCC("FORM") || caf ? std::endian::big : std::endian::little;
    std::uint64_t end = bytes.size(), at = caf ? 8 : 12;
    if (!caf)
        end = 8 + (rf64 ? loadLE<std::uint64_t>(bytes.data() + 20) : load<std::uint32_t>(bytes.data() + 4, order));
    EXPECT_LE(end, bytes.size()) << "container beyond the end of the file";
    end = std::min<std::uint64_t>(end, bytes.size());
    const std::uint64_t headerSize = caf ? 12 : 8;
    while (at + headerSize <= end) {
        const auto id = loadBE<FourCC>(bytes.data() + at);
        std::uint64_t size =
            caf ? loadBE<std::uint64_t>(bytes.data() + at + 4) : load<std::uint32_t>(bytes.data() + at + 4, order);
        at += headerSize;
        if (rf64 && id == fourCC("data"))
            size = loadLE<std::uint64_t>(bytes.data() + 28);
        if (caf && id == fourCC("data") && size == ~std::uint64_t{0})
            size = end - at;
        if (size > end - at) {
            EXPECT_TRUE(caf && id == fourCC("free")) << fourCCText(id) << " is cut short";
            return found;
        }
        if (id != fourCC("free") && id != fourCC("ds64"))
            found.emplace_back(id, std::string(textOf(bytes.subspan(at, size))));
        at += size + (caf ? 0 : size & 1);
    }
    EXPECT_EQ(at, end) << "bytes that are no chunk";
    return found;
}

inline std::unique_ptr<platform::AudioFile> openAudio(const std::string& path, bool forWriting = true,
                                                      std::int32_t* status = nullptr)
{
    using namespace platform;
    return AudioFile::open(*urlOf(path), forWriting ? AudioFile::Permission::readWrite : AudioFile::Permission::read, 0,
                           status);
}

inline std::int32_t setItem(platform::AudioFile& file, FourCC type, std::uint32_t index, const std::string& body)
{
    return file.setUserData(type, index, static_cast<std::uint32_t>(body.size()), body.data());
}

/// All items of a type.
inline std::vector<std::string> itemsOf(platform::AudioFile& file, FourCC type)
{
    std::uint32_t count = 0;
    EXPECT_EQ(file.countUserData(type, count), 0);
    std::vector<std::string> items;
    for (std::uint32_t i = 0; i < count; ++i) {
        std::uint32_t size = 0;
        EXPECT_EQ(file.userDataSize(type, i, size), 0);
        items.emplace_back(size, '\0');
        EXPECT_EQ(file.userData(type, i, size, items.back().data()), 0);
    }
    return items;
}
