// What the options of an edit say.
#pragma once

#include "audiofile/CCoordinatedEdit.h"
#include "c/ktfiles.h"

struct EditSettings {
    std::uint32_t flags = 0; // of ktf_edit_flag
    CoordinatedEditOptions how;

    bool hasFlag(std::uint32_t flag) const { return (flags & flag) != 0; }
};

/// Null stands for the defaults. Options that make no sense are told of.
ktf_status readEditOptions(const char* path, const ktf_edit_options* options, EditSettings& settings);
