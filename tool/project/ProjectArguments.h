// What the objects of `ktfiles project` are told on the command line.
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
    bool undo = false;   // of an exchange that was cut short
    bool forget = false; // likewise
    EditOptions edit;
    WaitOptions wait;
};
