// Describes the elements of an ADM document in words.
#pragma once

#include "adm/ADMDocument.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

/// The description of one element. Names are as in the document, not made safe for a terminal.
struct AdmNode {
    std::string_view kind; // "programme", "block", …
    std::string name;      // empty for a block
    std::string id;
    std::vector<std::string> details;
};

AdmNode describe(const ADMAudioProgramme& programme);
AdmNode describe(const ADMAudioContent& content);
AdmNode describe(const ADMAudioObject& object);
AdmNode describe(const ADMAudioPackFormat& pack);
AdmNode describe(const ADMAudioChannelFormat& channel);
AdmNode describe(const ADMAudioStreamFormat& stream);
AdmNode describe(const ADMAudioTrackFormat& track);
/// Named after its format or its channel; the details describe the rest of its chain of formats.
AdmNode describe(const ADMAudioTrackUID& track);
AdmNode describe(const ADMAudioBlockFormat& block);
