// The edits of a container: adding a chunk after its last, and removing all chunks of an id. They work in place and
// roll nothing back.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/core/Bytes.h"

#include <cstdint>
#include <span>
#include <vector>

class CFileIO;
class FileWindow;
struct ContainerEnd;

/// Edits one file. Owns neither the file nor its description, which it keeps true when an edit moves the samples or
/// changes the length.
class ContainerEditor {
public:
    // What the edits return besides the status of an operation on the file.
    static constexpr std::int32_t kAdded = 1;              // the chunk is there
    static constexpr std::int32_t kNoChunkedContainer = 0; // the file is no chunked container
    static constexpr std::int32_t kEndFound = 1;           // findEnd() succeeded
    static constexpr std::int32_t kHeaderUnreadable = -2;  // the container's header
    /// the first was not read, or the new one (in CAF: all of it) not written
    static constexpr std::int32_t kChunkHeaderFailed = -3;
    static constexpr std::int32_t kChunkBodyNotWritten = -4; // what was written is no whole chunk
    static constexpr std::int32_t kHeaderNotWritten = -5;    // the container's, or the last chunk's

    /// Borrows both.
    ContainerEditor(CFileIO& file, AudioFileInfo& info) : file_(file), info_(info) {}

    /// Adds a chunk: kAdded, kNoChunkedContainer, or an error. `atOpen` (may be null) is used while the file's stamp
    /// is the one of opening.
    std::int32_t append(FourCC id, BytesView body, const ContainerEnd* atOpen = nullptr);
    /// Finds the container's end: kEndFound, or what append() returns then.
    static std::int32_t findEnd(FileWindow& window, ContainerEnd& end);
    /// Which chunks go where a CAF file has several: the first that is not empty, as hosts expect it, or all.
    enum class OfCAF { first, all };
    /// Removes chunks: 0, also when there was none, or an error. Nothing is removed when a header cannot be read.
    std::int32_t remove(FourCC id, OfCAF which = OfCAF::first);

private:
    struct Extent {
        std::int64_t position = 0; // of the header
        std::int64_t next = 0;     // of the following chunk
    };

    bool isCAF() const { return info_.fileType == kCaff; }

    std::int32_t appendToCAF(FourCC id, BytesView body);
    std::int32_t appendToContainer(FourCC id, BytesView body, const ContainerEnd* atOpen);
    std::int32_t storeLastSize(const ContainerEnd& end, ContainerChkExtended& header);
    std::int32_t writeTogether(std::int64_t position, std::span<const BytesView> pieces);
    std::int32_t writeApart(std::int64_t position, std::span<const BytesView> pieces);
    std::int32_t writeChunk(std::int64_t position, const ChkHeader& chunk, BytesView body, bool padded);
    std::int32_t writeChunkHeader(std::int64_t position, ChkHeader chunk, const ContainerChkExtended& header);
    std::int32_t writeContainerHeader(ContainerChkExtended header);
    std::int32_t storeSizesOutright(const ContainerChkExtended& header);

    std::int32_t findAll(FileWindow& window, FourCC id, std::vector<Extent>& found) const;
    std::int32_t cutOut(const std::vector<Extent>& holes);
    std::int32_t closeUp(const std::vector<Extent>& holes, std::int64_t& to);
    std::int32_t shrink(ContainerChkExtended header, const std::vector<Extent>& holes);
    std::int32_t renameToFree(std::int64_t position, const ContainerChkExtended& header);

    CFileIO& file_;
    AudioFileInfo& info_;
};
