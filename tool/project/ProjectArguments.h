// The arguments of the objects of `ktfiles project`.
#pragma once

#include "tool/shared/access/Waiting.h"
#include "tool/shared/edits/SafeEdit.h"

#include <optional>
#include <string>

struct ProjectArguments {
    std::string package, backup, name;
    std::optional<long> alternative;
    long index = 0;
    int keep = 0;
    bool missing = false;
    bool create = false;
    bool undo = false;   // an exchange that was cut short
    bool forget = false; // likewise
    EditOptions edit;
    WaitOptions wait;
};
