// Edits the metadata of one file: worked out in memory, written through the audio-file service, read again.
#pragma once

#include "tool/meta/MetaEdit.h"

/// One field before and after.
struct MetaChange {
    std::string field;
    std::optional<MetaField::Value> from, to; // none if it does not exist
};

/// One chunk to write or remove, by id and index among those with the id.
struct MetaItemEdit {
    FourCC id = 0;
    std::uint32_t index = 0;
    std::optional<Bytes> body; // none: remove
};

/// A measured value that does not exist, and the reason.
struct UnmeasuredField {
    std::string field, why;
};

struct MetaPlan {
    std::vector<MetaChange> changes;
    std::vector<MetaItemEdit> items; // writes in order of index, removals last
    std::vector<FourCC> ids;         // of the changed chunks
    std::vector<UnmeasuredField> unmeasured;
    std::vector<std::string> left; // what the file has no place for, in words
    HeldMetadata before, after;
};

/// The metadata to edit. Throws Failure; OtherKind for compressed files, and for containers whose chunks cannot be
/// written here.
HeldMetadata holdEdited(const std::string& path, const MetaGroups& groups = {});

/// Throws Failure.
MetaPlan planMetadata(const std::string& path, const std::vector<MetaStep>& steps, bool isLenient);

/// Steps that depend on the file's content, in stages: each uses the names left by the one before. The index after the
/// last item stands for a new one. Throws Failure.
using MetaStages = std::function<std::vector<std::vector<MetaStep>>(const HeldMetadata& held)>;
MetaPlan planMetadata(const std::string& path, const MetaStages& stagesFor, bool isLenient);

/// Edits the file itself and reads it again. Throws Failure, also if a chunk is not found as expected afterwards.
void writeMetadata(const std::string& path, const MetaPlan& plan);
