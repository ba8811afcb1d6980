// Edits of the metadata of one file: worked out in memory, made through the audio-file service, read again.
#pragma once

#include "tool/meta/MetaEdit.h"

/// One field before and after.
struct MetaChange {
    std::string field;
    std::optional<MetaField::Value> from, to; // none: not there
};

/// One chunk to write or to remove: by its id and its index among those of the id.
struct MetaItemEdit {
    FourCC id = 0;
    std::uint32_t index = 0;
    std::optional<Bytes> body; // none: it goes
};

/// One that was measured and has no number, and why.
struct UnmeasuredField {
    std::string field, why;
};

struct MetaPlan {
    std::vector<MetaChange> changes;
    std::vector<MetaItemEdit> items; // those that are written in order of index, removals last
    std::vector<FourCC> ids;         // of the chunks that change
    std::vector<UnmeasuredField> unmeasured;
    std::vector<std::string> left; // that the file has no place for, in words
    HeldMetadata before, after;
};

/// What there is to edit. Throws Failure; OtherKind of compressed files, and of containers whose chunks nobody here
/// writes.
HeldMetadata holdEdited(const std::string& path, const MetaGroups& groups = {});

/// Throws Failure.
MetaPlan planMetadata(const std::string& path, const std::vector<MetaStep>& steps, bool isLenient);

/// Steps that follow from what the file has, in stages: the names of each are those that the one before left. An index
/// one beyond the last stands for a new item. Throws Failure.
using MetaStages = std::function<std::vector<std::vector<MetaStep>>(const HeldMetadata& held)>;
MetaPlan planMetadata(const std::string& path, const MetaStages& stagesFor, bool isLenient);

/// Makes the edit of the file itself, and reads it again. Throws Failure, also when a chunk is then not found as it
/// should be.
void writeMetadata(const std::string& path, const MetaPlan& plan);
