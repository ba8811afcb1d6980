// Chunks of files of any kind: in the file when it is a container, else beside it, as the library's chunk utilities
// keep them. What is beside it is changed on a copy, like every file that the command edits.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"
#include "tool/shared/edits/SafeEdit.h"

#include <cstdint>
#include <optional>
#include <string>

class Verb;

void addSidecarOption(Verb& verb, std::string& extension);

struct SidecarChunk {
    Bytes body;
    std::string source; // the path of the file that has it
};

/// Throws Failure when neither the sidecars nor the file have it. Of a metadata sidecar that is a container the chunk,
/// of any other the whole content.
SidecarChunk readFromAnywhere(const std::string& path, FourCC id, const std::string& extension);

/// Whether chunks of the file are kept in the file itself. Throws Failure for what cannot be read.
bool keepsItsChunks(const std::string& path);

struct SidecarRemoval {
    std::int64_t count = 0; // chunks, the raw sidecar counting as one
    std::string where;      // the path of the first that was changed, or would be; empty: none
};

/// The two files beside a file that hold chunks for it: the metadata sidecar, and the raw one, whose content is one
/// chunk. Each is locked while it is changed, since several files share them (s.mp3 and s.ogg have s.ktmd). With
/// `dryRun` nothing is changed. Throws Failure.
class Sidecars {
public:
    /// They lie beside the file itself, symbolic links resolved.
    Sidecars(const std::string& path, const std::string& extension, const EditOptions& options);

    /// The file, symbolic links resolved.
    const std::string& file() const { return file_; }

    /// Why the raw sidecar should not be removed or replaced: it is a recording.
    std::optional<std::string> objection() const;

    /// Puts the chunk into the metadata sidecar, which is made where there is none, in the place of those of its id; a
    /// raw sidecar that is there is written anew. Returns the path of the metadata sidecar in the words
    /// of the file's.
    std::string add(FourCC id, const Bytes& body, bool force);
    SidecarRemoval remove(FourCC id);
    /// Does nothing where there is none.
    void removeRaw();

private:
    void addToMetadata(FourCC id, const Bytes& body, bool force);
    bool createMetadata(FourCC id, const Bytes& body);
    void rewriteRaw(const Bytes& body);

    std::string given_, file_;
    std::string metadata_, raw_; // empty: the name is that of another of the three, which must not pass for two
    EditOptions options_;
};
