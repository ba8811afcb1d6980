// The XML of an ADM document, from a file of its own or from the chunk "axml" of an audio file.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "platform/InputStream.h"
#include "platform/core/Error.h"

#include <cstdint>
#include <memory>
#include <optional>

/// Codes of the domain "adm". Other errors are of the domain "status".
enum class ADMFileError : std::int64_t {
    unknownFile = 1, // empty, or of no kind known here
    otherFile = 2,   // neither XML nor a file with chunks
    noChunk = 3,     // a container without "axml"
    badChunk = 4,    // "axml" is empty, or the file does not have all of it
    badDocument = 5  // the document breaks a rule; "line", "column", "name" and "elementID" in the user information
};

/// The domain of these errors.
inline constexpr const char* kADMErrorDomain = "adm";

/// An open file, read piece by piece.
class KT_EXPORT ADMSource {
public:
    /// Whether a container without the chunk is accepted.
    enum class Document : bool { isThere, mayLack };

    /// Null if the file is neither XML nor a container, and for a container without the chunk.
    static std::unique_ptr<ADMSource> open(const CFileRef& file, Document document = Document::isThere,
                                           platform::Error* error = nullptr);

    /// Whether the XML is a chunk of an audio file.
    bool isAudio() const { return isAudio_; }
    /// False if the container has no document.
    bool hasDocument() const { return end_ > begin_; }
    /// Of the sound beside it; 0 where there is none.
    int channels() const { return file_.Info().channels; }
    /// The body of the chunk "chna", as far as the file holds it; none if there is no such chunk. False if it cannot be
    /// read.
    bool readTrackChunk(std::optional<Bytes>& chunk, platform::Error* error = nullptr);

    /// Size of the XML in bytes, without NUL bytes at the end, which some programs reserve in the chunk.
    std::int64_t size() const { return end_ - begin_; }
    /// Must not outlive the source.
    std::unique_ptr<platform::InputStream> stream();

private:
    ADMSource() = default;
    bool openFile(const CFileRef& file, Document document, platform::Error* error);
    bool findChunk(Document document, platform::Error* error);
    bool dropTrailingNULs(platform::Error* error);
    bool isUTF16();

    CAudioFileIO file_;
    bool isAudio_ = false;
    std::int64_t begin_ = 0;
    std::int64_t end_ = 0;
};
