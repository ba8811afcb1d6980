// Where the XML of an ADM document comes from: a file of its own, or the chunk "axml" of an audio file.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "platform/InputStream.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

/// An open file, read in pieces.
class AdmSource {
public:
    /// Whether a container may lack the chunk.
    enum class Document : bool { isThere, mayLack };

    /// Throws Failure: also for what is neither XML nor a container, and for a container without the chunk.
    explicit AdmSource(const std::string& path, Document document = Document::isThere);

    /// Whether the XML is a chunk of an audio file.
    bool isAudio() const { return isAudio_; }
    /// False for a container that lacks it.
    bool hasDocument() const { return end_ > begin_; }
    int channels() const { return file_.Info().channels; }
    /// What there is of the body of the chunk "chna"; null where there is no such chunk.
    std::optional<Bytes> trackChunk();

    /// Bytes of XML. NUL bytes at the end, which some programs reserve in the chunk, do not count.
    std::int64_t size() const { return end_ - begin_; }
    /// Must not outlive the source.
    std::unique_ptr<platform::InputStream> stream();

private:
    void dropTrailingNuls();
    bool isUTF16();

    CAudioFileIO file_;
    bool isAudio_ = false;
    std::int64_t begin_ = 0;
    std::int64_t end_ = 0;
};
