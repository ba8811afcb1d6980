// CAudioFileIO is a CFileIO opened on an audio file: it describes the file, reads and writes its samples, and finds,
// adds and removes chunks in its container without changing others.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "audiofile/CChunkData.h"
#include "files/CFileIO.h"
#include "media/containers/ContainerHeaders.h"
#include "media/containers/ContainerTraits.h"
#include "media/userdata/AudioFileService.h"
#include "platform/ContentType.h"
#include "platform/core/Error.h"

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>

class FileWindow;
struct ContainerEnd;

namespace platform {
class ConvertingReader;
}

/// One chunk of a container, as a walk meets it.
struct ChunkEntry {
    FourCC id = 0;           // of the chunk
    std::int64_t offset = 0; // of the header, from the start of the file
    std::int64_t size = 0;   // of the body, in bytes; in a damaged file it may reach past the end, or be negative
    std::int64_t body = 0;   // of the body, from the start of the file
};

/// Where a container begins and ends.
struct ContainerExtent {
    FourCC id = 0;               // "RIFF", "RF64", "BW64", "FORM", "caff", "CAT ", "RIFX", "W64f"
    std::int64_t end = 0;        // where the container ends, as it says
    std::int64_t fileLength = 0; // in bytes
    platform::ContainerKind kind = platform::ContainerKind::riff; // which container it is
};

/// An audio file. While it is open for reading only, container headers are kept once read, until the file's length or
/// its time of change differs. While it is open for writing they are read anew for every operation; only the first
/// chunk that is added relies on what opening read, where a later change would show. The description stays as it was
/// at opening.
class KT_EXPORT CAudioFileIO : public CFileIO {
public:
    CAudioFileIO();
    /// As Open. Stays closed when write access is wanted to something without a path, something missing, or a
    /// directory.
    CAudioFileIO(const CFileRef& ref, unsigned int permission);
    ~CAudioFileIO() override;

    void Init() override;
    /// Opens and describes a file. The status of the base open; kStatusFileNotFound for write access to something
    /// missing or a directory. InfoStatus() has the status of describing it.
    std::int32_t Open(const CFileRef& ref, unsigned int permission) override;
    /// As Open, but describes only a file with chunks (HasChunks), so that no decoder is ever loaded for another. A
    /// file without chunks is open too, and its InfoStatus() is kStatusParameterError.
    std::int32_t OpenForChunks(const CFileRef& ref, unsigned int permission);
    std::int32_t Close() override;
    /// Creates (or empties) a file, writes its header for no frames, and opens it for writing. `cacheSize` is the
    /// read cache in KiB; `channels` of 0 means as many as the bus format has; `headerOption` as in
    /// BuildAudioFileHeader.
    std::int32_t CreateAndOpenCommon(const CFileRef& ref, long cacheSize, TAudioBusFormat busFormat, int channels,
                                     int bitsPerSample, long sampleRate, unsigned int fileType, bool headerOption);

    /// The description of the open file, kept true by writing and by edits.
    const AudioFileInfo& Info() const { return info_; }
    /// The status of GetAudioFileInfo when the file was opened. After a failed read the description is incomplete:
    /// nothing is added to such a file, removed from it or cut off.
    std::int32_t InfoStatus() const { return infoStatus_; }
    /// Bits per sample; -32 for 32-bit floats.
    std::int32_t SampleFormat() const { return sampleFormat_; }

    /// The kind of chunked container: "WAVE", "AIFF", "REX2", or 0. CAF files have a walk of their own and give 0.
    FourCC IsChunkBased();
    /// Whether the open file has chunks, which ForEachChunk and LocateChunk find.
    bool HasChunks();
    /// Whether chunks can be added: IsChunkBased() knows the container, or it is CAF. RIFX and Wave64 are only read.
    bool TakesChunks();
    /// Reads the container's header; 0, or -3.
    std::int32_t ReadExtendedFileHeader(ContainerChkExtended& header);
    /// The position of the chunk after `current`, whose header goes to `next`; position 0 asks for the first. The
    /// walk is over when the result does not exceed `position` or reaches the container's end.
    long long NextChunkHeader(long long position, ChkHeader* current, ChkHeader* next, int* error,
                              const ContainerChkExtended& header);
    /// Calls `visit` for every chunk in file order until it returns false; CAF too. 0 (also when stopped), -1 not open,
    /// -2 no container, -3 header unreadable, else the status of a read that failed.
    std::int32_t ForEachChunk(const std::function<bool(const ChunkEntry&)>& visit, ContainerExtent* extent = nullptr);

    /// 1 found, 0 not found, or an error. Of several chunks of an id the last is found; in CAF the first with a size
    /// above 0. `data` may be null; else it receives an array for delete[].
    ///
    /// Kept: 0 for a CAF file whose headers cannot be read; LocateChunk gives the status.
    std::int32_t FindChunk(unsigned int id, char** data, long* size, long long* position, long long* next);
    /// The same into a record, which owns the body.
    std::int32_t FindChunk(unsigned int id, CChunkData& chunk);
    /// The header of that chunk, without its body; a failed read is an error in CAF too.
    std::int32_t LocateChunk(FourCC id, ChunkEntry& chunk);
    /// The body; null when the chunk is not found or unreadable.
    std::optional<Bytes> FindChunk(unsigned int id);
    /// Adds a chunk after the container's last; `replace` first removes every chunk of that id. 1 added, 0 no chunked
    /// container, or an error. Nothing is rolled back on failure.
    std::int32_t AddChunk(unsigned int id, const void* data, long size, bool replace);
    /// Each the same, of a record or a view.
    std::int32_t AddChunk(const CChunkData& chunk, bool replace);
    std::int32_t AddChunk(unsigned int id, BytesView data, bool replace);
    /// Prepares the container's end for one more chunk where that costs nothing: supplies a missing last pad byte,
    /// cuts off stray bytes that are fewer than a chunk header, and gives an open-ended CAF "data" its size. 0 when
    /// AddChunk will then put a chunk where readers find it, without harm; kStatusParameterError, and the file
    /// untouched, when more than that follows the last chunk, or when a CAF file's last chunk claims more than is
    /// there; else as ForEachChunk, or a status of reading or writing.
    std::int32_t PrepareToAppend();
    /// Removes every chunk of that id (in CAF the first): a chunk ahead of the samples is renamed "free", others are
    /// cut out.
    std::int32_t RemoveChunk(unsigned int id);
    /// Removes every chunk of that id, as repeated calls of RemoveChunk would, in linear time in CAF too; only empty
    /// ones stay there.
    std::int32_t RemoveAllChunks(unsigned int id);

    /// Replaces the positions in an AIFF file's "trns" chunk, and keeps everything else in it. False, with nothing
    /// written, when there is no such chunk of at least 76 bytes, for a count below 0 or beyond 178,956,967, and when
    /// memory is short; false too when replacing fails.
    bool ReplaceVireoLoopTransients(const std::int64_t* positions, std::int64_t count);

    /// Rewrites the header from the description if samples were written.
    std::int32_t UpdateHeader();
    /// Rewrites the header for a number of frames and sets the file's length to match, cutting off what follows the
    /// samples. The pad byte of an odd length comes with UpdateHeader, AddChunk or Close. kStatusParameterError, and
    /// the file unchanged, when the header is not one that BuildAudioFileHeader makes.
    std::int32_t SetNumFrames(long frames);

    /// Prepares to read compressed data, and corrects rate, channels and number of frames in the description to what
    /// the decoder finds; reading frames does so by itself. 0, also for linear PCM; "fmt?" when nothing decodes the
    /// data, and then `error` (may be null) says what to install where that would help; kStatusParameterError for a
    /// file in memory.
    std::int32_t OpenDecoder(platform::Error* error = nullptr);
    /// Reads frames from `frame` on as interleaved floats, linear PCM in [-1, 1). `framesRead` (may be null) gets how
    /// many were delivered, also on failure. kStatusEndOfFile when fewer than asked are there; else as OpenDecoder;
    /// kStatusParameterError for samples that the library does not read.
    std::int32_t ReadFrames(float* to, long long frame, long count, long* framesRead = nullptr);
    /// Writes interleaved floats at `frame`, at most the frame count; the frame count grows, and UpdateHeader or
    /// Close rewrites the header. kStatusFileTooBig when the container cannot hold that many; kStatusParameterError
    /// when other bytes follow the samples and would be overwritten.
    std::int32_t WriteFrames(const float* from, long long frame, long count);

    /// Hears how many frames of the file are done; its false ends the work.
    using OverviewProgress = std::function<bool(long long framesDone, long long frames)>;
    /// A waveform overview of the whole file, laid out as loops/overview/OverviewBlock.h says. Null on failure, and
    /// `status` (may be null) then has the reason: kStatusEndOfFile for a file without frames, kStatusParameterError
    /// for samples that the library does not read and for more than 2,048 channels, kStatusUserCancelled when
    /// `progress` (may be empty) returned false, else the status of OpenDecoder or of a failed read. A file that ends
    /// ahead of its samples gives an overview of what is there; AudioFileInfo::missingDataSize tells. Defined in
    /// loops/overview/.
    std::unique_ptr<KTMem> CreateOverview();
    /// The same, with progress and the reason of a failure.
    std::unique_ptr<KTMem> CreateOverview(const OverviewProgress& progress, std::int32_t* status = nullptr);

    /// Turns a value between the order of the file, little-endian for "WAVE" and big-endian otherwise, and host
    /// order; either way.
    void ByteOrder(int* value) const;
    /// The same.
    void ByteOrder(unsigned int* value) const;

    /// Whether the type is audio other than FLAC: FLAC files are refused on purpose.
    static bool IsSupportedFileType(const platform::String& contentTypeIdentifier);
    /// The same of a content type.
    static bool IsSupportedFileType(const platform::ContentType& contentType);

    // A CAF file carries the suite's chunks as "uuid" user-data items: 16 bytes of UUID, then the chunk's body. These
    // functions work on a handle of the audio-file service, not on the file that this object has open.

    /// Opens the file for reading and writing and calls `block` with the handle. When it cannot be opened nothing
    /// happens, and the status says why.
    static std::int32_t PerformAudioFileOperations(const CFileRef& ref,
                                                   const std::function<void(platform::AudioFile&)>& block);
    /// Called with one item: `data` and `size` include the UUID and are valid during the call only; `index` is always
    /// 0.
    using UUIDChunkBlock =
        std::function<void(const unsigned char* uuid, void* data, unsigned int size, int index, bool* stop)>;
    /// Calls `block` for every such item until it sets `*stop`.
    static void ForAllUUIDChunksPerformBlock(platform::AudioFile& file, const UUIDChunkBlock& block);
    /// 0 when an item of the UUID is there, else -1; `size` (may be null) gets its size, UUID included.
    static std::int32_t FindCAFChunkInUUIDChunk(platform::AudioFile& file, const unsigned char* uuid,
                                                unsigned int* size, void* reserved);
    /// Adds an item, or replaces the item of that UUID; `data` begins with the UUID, and `size` counts it. 0 or a
    /// status.
    static std::int32_t AddCAFChunkToUUIDChunk(platform::AudioFile& file, const unsigned char* uuid, unsigned int size,
                                               const void* data);
    /// Removes the item of the UUID: 0 or a status.
    static std::int32_t RemoveCAFChunkFromUUIDChunk(platform::AudioFile& file, const unsigned char* uuid);

private:
    bool IsOpenCAF() const { return info_.fileType == kCaff; }
    std::int32_t ReadCompressedFrames(float* to, long long frame, long count, long& delivered);
    bool HasBuiltHeader();
    std::int32_t PrepareToWrite(long long frame, long count);
    void FramesWritten(long long frames);
    /// The position of a chunk.
    struct FoundChunk {
        std::int64_t position = 0; // of the header
        std::int64_t body = 0;
        std::int64_t size = 0;
        std::int64_t next = 0;
        std::int64_t fileLength = 0; // when it was found
        bool isEditable = false;     // that its container is
        bool HasItsBytes() const { return size >= 0 && size <= fileLength - body; }
    };
    std::int32_t Locate(FourCC id, FoundChunk& found);
    std::int32_t Find(FourCC id, FoundChunk& found);
    FileWindow& Window(std::optional<FileWindow>& own);
    std::int32_t PrepareToEdit();
    std::int32_t SettleOpenEnd(const ChunkEntry& data);
    void ForgetFile();
    std::int32_t ReadBytes(void* to, const FoundChunk& found);
    std::int32_t ReadBody(const FoundChunk& found, std::unique_ptr<char[]>& data);
    std::int32_t OpenUndescribed(const CFileRef& ref, unsigned int permission);
    void Describe(unsigned int permission);
    void KeepEnd(FileWindow& window);

    AudioFileInfo info_;
    std::int32_t infoStatus_ = 0;
    std::int32_t readFailure_ = 0;                        // the one that the description met
    std::unique_ptr<FileWindow> window_;                  // on a file that is open for reading; null otherwise
    FileStamp windowStamp_;                               // of the file when the window was opened
    std::unique_ptr<ContainerEnd> endAtOpen_;             // while StampAtOpen() is the file's; may be null
    std::unique_ptr<platform::ConvertingReader> decoder_; // of compressed data; null until it is read
    std::int32_t sampleFormat_ = 0;
    bool headerDirty_ = false;
    bool headerOption_ = false;
};
