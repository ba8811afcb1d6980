// What an edit of a container is about. Everything else in the file must survive it to the byte.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <vector>

/// The chunks that an edit may change.
struct EditScope {
    /// Whether anything is compared at all.
    enum class Kind {
        chunks, // of a container
        whole   // of a file that is no container, or of a damaged one that is edited nevertheless
    };

    Kind kind = Kind::chunks; // what is compared
    std::vector<FourCC> ids;  // chunks that may come, go and change
    bool loopChunks = false;  // as well as those of loops: "uuid" chunks of a CAF file that are known as such

    /// Chunks of one id.
    static EditScope chunk(FourCC id) { return {Kind::chunks, {id}, false}; }
    /// Nothing is compared.
    static EditScope wholeFile() { return {Kind::whole, {}, false}; }
    /// All chunks that keep loop tags, and the texts beside them.
    KT_EXPORT static EditScope ofLoopTags();
};
