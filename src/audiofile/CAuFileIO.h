// CAuFileIO is the older audio-file class: linear PCM only, in any container of the audio-file service, as 32-bit
// floats; the suite's chunks are user data of the service. CAudioFileIO works on containers itself.
#pragma once

#include "audiofile/CChunkData.h"
#include "files/CFileRef.h"
#include "media/userdata/AudioFileService.h"
#include "platform/FileSystem.h"

#include <cstdint>
#include <memory>

/// One open file, which it owns. Results are 0 or a status unless stated otherwise; reading and writing give
/// kStatusNotOpen when nothing is open. Frames count from 0, samples are interleaved.
class KT_EXPORT CAuFileIO {
public:
    enum : std::int32_t { kClosed = -1, kReadOnly = 1, kReadWrite = 3 }; // the open mode

    CAuFileIO();
    /// Opens the file; `status` gets the result, and the object is closed unless that is 0.
    CAuFileIO(int& status, const CFileRef& ref, unsigned char write);
    ~CAuFileIO();
    CAuFileIO(const CAuFileIO&) = delete;
    CAuFileIO& operator=(const CAuFileIO&) = delete;

    /// Opens the file of the reference; 0 at once when it is open in that mode. -208 for data that is not linear PCM:
    /// everything but the reference is then as in a new object. When the service cannot open the file, the wanted
    /// mode stays.
    std::int32_t Open(unsigned char write);
    /// Takes the reference, then opens its file.
    std::int32_t Open(const CFileRef& ref, unsigned char write);
    /// Takes the item of the handle, then opens it.
    std::int32_t Open(const platform::FileHandle* handle, unsigned char write);
    /// Closes the file; the mode, format and counts stay.
    void Close();
    /// Closes the file, and resets everything but the reference to the state of a new object.
    void CloseFileAndInit();
    /// Creates a file of linear PCM, open for reading and writing. "WAVE" is little-endian, every other type
    /// big-endian; 32 bits are floats, which AIFF cannot hold. The second and the last parameter are not used. On
    /// failure nothing changes; a file that exists is a failure.
    std::int32_t CreateAndOpen(const CFileRef& ref, long, int channels, int bits, long sampleRate, long fileType,
                               const platform::FileHandle*);
    /// The same at a URL.
    std::int32_t CreateAndOpen(const platform::URLRef& url, long, int channels, int bits, long sampleRate,
                               long fileType, const platform::FileHandle*);

    /// The file, open or not.
    const CFileRef& FileRef() const { return fileRef_; }
    /// kClosed, kReadOnly or kReadWrite.
    std::int32_t OpenMode() const { return openMode_; }
    /// How the samples are coded; zeros before the first file.
    const platform::StreamDescription& DataFormat() const { return dataFormat_; }
    /// Of each frame.
    unsigned int NumChannels() const { return dataFormat_.channelsPerFrame; }
    /// In bits per sample.
    unsigned int BitDepth() const { return dataFormat_.bitsPerChannel; }
    /// "WAVE", "AIFF", "AIFC" or "caff"; 0 before the first file.
    FourCC FileType() const { return fileType_; }
    /// In Hz, rounded down; 0 for a rate beyond 32 bits.
    unsigned int SampleRate() const;
    /// As counted when the file was opened: writing does not change it. 0 for samples of less than a byte.
    std::int64_t NumFrames() const;
    /// How many bytes that many frames take.
    std::int64_t FramesToBytes(long frames) const;
    /// How many whole frames fit in that many bytes; 0 for samples of less than a byte.
    std::int64_t BytesToFrames(unsigned long long bytes) const;
    /// Whether samples are big-endian; of 8-bit data whether they are unsigned, as in "WAVE".
    bool Swapped() const;

    /// Reads `frames` frames to `dest` and sets `frames` to how many there were. On failure, which includes that there
    /// was none, the whole range of `dest` is zero and `frames` stays.
    std::int32_t ReadFloat(float* dest, long startFrame, long& frames);
    /// Writes floats, clamped to full scale. -54 unless the file is open for writing; -50 without `src`.
    std::int32_t WriteFloat(float* src, long startFrame, long frames);
    /// Writes samples in the processor's byte order. Kept: when the file has the other order, the samples at `data`
    /// are swapped in place, and stay so. -1 without a bit depth.
    std::int32_t WriteData(const void* data, long startFrame, long frames);

    /// Reads a chunk: 1 found, -1 not open, -2 no such item or an empty one, -3 unreadable. The chunk's positions are
    /// -1 when it is found.
    int FindChunk(long id, CChunkData& chunk);
    /// Adds or replaces an item: 1, or -1. The second parameter is not used.
    int AddChunk(CChunkData& chunk, unsigned char);
    /// Removes a chunk; -1 when the file is not open for writing.
    std::int32_t RemoveChunk(long id);
    /// Whether the file has a basic tagging chunk.
    bool IsVireoLoop();

    /// Turns a value between the order of the file, little-endian for "WAVE" and big-endian otherwise, and host
    /// order; either way.
    void ByteOrder(int& value) const;
    /// Each turns a value of its type in the same way.
    void ByteOrder(short& value) const;
    void ByteOrder(unsigned int& value) const;
    void ByteOrder(unsigned short& value) const;

private:
    void Init();
    void ResetCounts();
    bool IsWritable() const { return file_ && openMode_ == kReadWrite; }
    std::int32_t ReadDescription();
    std::int64_t BytesPerSample() const { return dataFormat_.bitsPerChannel / 8; }
    platform::SampleFormat FileSamples() const;
    /// Whether a frame takes just the bytes of its samples.
    bool HasPackedSamples() const;
    std::int32_t ReadSamples(float* dest, std::int64_t startFrame, std::int64_t& frames);

    CFileRef fileRef_;
    std::unique_ptr<platform::AudioFile> file_;
    platform::StreamDescription dataFormat_;
    std::uint64_t audioByteCount_;
    std::uint64_t packetCount_;
    FourCC fileType_;
    std::int32_t openMode_;
};
