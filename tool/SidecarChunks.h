// Chunks of files of any kind: in the file when it is a container, else beside it, as the library's chunk utilities
// keep them.
#pragma once

#include "SafeEdit.h"
#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <string>

namespace CLI {
class App;
}

void addSidecarOption(CLI::App& verb, std::string& extension);

struct SidecarChunk {
    Bytes body;
    std::string source; // the path of the file that has it
};

/// Throws Failure when neither the sidecars nor the file have it. Of a metadata sidecar that is a container the chunk,
/// of any other the whole content.
SidecarChunk readFromAnywhere(const std::string& path, FourCC id, const std::string& extension);

/// Whether chunks of the file are kept in the file itself. Throws Failure for what cannot be read.
bool keepsItsChunks(const std::string& path);

struct SidecarEdit {
    std::string where;  // the path of the file that was changed, or would be
    std::string backup; // empty: none
};

/// Puts the chunk into the place of all older copies. Throws Failure.
SidecarEdit addAnywhere(SafeEdit& edit, FourCC id, const Bytes& body, const std::string& extension, bool dryRun);
/// Removes all copies, that in the metadata sidecar too. `count` receives their number. Throws Failure when there is
/// none.
SidecarEdit removeEverywhere(SafeEdit& edit, FourCC id, const std::string& extension, bool dryRun, std::int64_t& count);
