// The edits of a container: a chunk put behind its last, and all chunks of an id removed. They work in place and roll
// nothing back.
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

/// Owns neither the file nor its description, which it keeps true where an edit moves the samples or changes the
/// length.
class ContainerEditor {
public:
    // What the edits return beside the status of an operation on the file.
    static constexpr std::int32_t kAdded = 1;
    static constexpr std::int32_t kNoChunkedContainer = 0;
    static constexpr std::int32_t kEndFound = 1;
    static constexpr std::int32_t kHeaderUnreadable = -2;
    static constexpr std::int32_t kChunkHeaderFailed = -3; // the first not read, the new one (in CAF: all) not written
    static constexpr std::int32_t kChunkBodyNotWritten = -4;
    static constexpr std::int32_t kHeaderNotWritten = -5; // the container's, or that of the last chunk

    ContainerEditor(CFileIO& file, AudioFileInfo& info) : file_(file), info_(info) {}

    /// kAdded, kNoChunkedContainer, or an error. `atOpen` (may be null) serves while the file's stamp is the one that
    /// opening met.
    std::int32_t append(FourCC id, BytesView body, const ContainerEnd* atOpen = nullptr);
    /// kEndFound, or what append returns then.
    static std::int32_t findEnd(FileWindow& window, ContainerEnd& end);
    /// What goes where a CAF file has several: the first that is not empty, as hosts expect it, or all of these.
    enum class OfCAF { first, all };
    /// 0, also when there was none, or an error. Nothing is removed when a header cannot be read.
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
