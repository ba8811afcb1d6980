// What an edit of a container is about. All else in the file must come through it to the byte.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <vector>

struct EditScope {
    /// Whether anything is compared at all.
    enum class Kind {
        chunks, // of a container
        whole   // of a file that is no container, or of one that is damaged and edited all the same
    };

    Kind kind = Kind::chunks;
    std::vector<FourCC> ids; // chunks that may come, go and change
    bool loopChunks = false; // and those of loops: "uuid" chunks of a CAF file that are known as such

    static EditScope chunk(FourCC id) { return {Kind::chunks, {id}, false}; }
    static EditScope wholeFile() { return {Kind::whole, {}, false}; }
    /// Everything that loop tags are kept in, and the texts beside them.
    KT_EXPORT static EditScope ofLoopTags();
};
