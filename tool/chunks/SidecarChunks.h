// Chunks of any file: in the file if it is a container, else beside it, as the library's chunk utilities keep them.
// Sidecars are changed on a copy, like every file that the command edits.
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
    std::string source; // path of the file that holds it
};

/// Throws Failure if neither the sidecars nor the file have it. Yields a chunk of a metadata sidecar that is a
/// container, and the whole content of any other sidecar.
SidecarChunk readFromAnywhere(const std::string& path, FourCC id, const std::string& extension);

/// Whether the file holds its chunks itself. Throws Failure if it cannot be read.
bool keepsItsChunks(const std::string& path);

struct SidecarRemoval {
    std::int64_t count = 0; // chunks; the raw sidecar counts as one
    std::string where;      // path of the first file that was (or would be) changed; empty if none
};

/// The two sidecars of a file: the metadata sidecar holds chunks, the raw sidecar's content is one chunk. Each is
/// locked while it changes, because several files share them (s.mp3 and s.ogg have s.ktmd). With `dryRun` nothing
/// changes. Throws Failure.
class Sidecars {
public:
    /// Looks beside the file itself, with symbolic links resolved.
    Sidecars(const std::string& path, const std::string& extension, const EditOptions& options);

    /// The file, with symbolic links resolved.
    const std::string& file() const { return file_; }

    /// The reason not to remove or replace the raw sidecar: it is a recording.
    std::optional<std::string> objection() const;

    /// Puts the chunk into the metadata sidecar in place of those with its id, and creates the sidecar if necessary;
    /// rewrites a raw sidecar that exists. Returns the path of the metadata sidecar, spelt like the file's.
    std::string add(FourCC id, const Bytes& body, bool force);
    SidecarRemoval remove(FourCC id);
    /// Does nothing if there is none.
    void removeRaw();

private:
    void addToMetadata(FourCC id, const Bytes& body, bool force);
    bool createMetadata(FourCC id, const Bytes& body);
    void rewriteRaw(const Bytes& body);

    std::string given_, file_;
    // Empty if the name is that of another of the three files, which must not pass for two.
    std::string metadata_, raw_;
    EditOptions options_;
};
