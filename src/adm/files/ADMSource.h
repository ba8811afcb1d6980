// The XML of an ADM document, from a file of its own or from the chunk "axml" of an audio file.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "platform/InputStream.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

/// An open file, read piece by piece.
class AdmSource {
public:
    /// Whether a container without the chunk is accepted.
    enum class Document : bool { isThere, mayLack };

    /// Throws Failure, also if the file is neither XML nor a container, or a container without the chunk.
    explicit AdmSource(const std::string& path, Document document = Document::isThere);

    /// Whether the XML is a chunk of an audio file.
    bool isAudio() const { return isAudio_; }
    /// False if the container has no document.
    bool hasDocument() const { return end_ > begin_; }
    int channels() const { return file_.Info().channels; }
    /// The body of the chunk "chna", as far as the file holds it; null if there is no such chunk.
    std::optional<Bytes> trackChunk();

    /// Size of the XML in bytes, without NUL bytes at the end, which some programs reserve in the chunk.
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
