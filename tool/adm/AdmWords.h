// The elements of an ADM document in words for people.
#pragma once

#include "adm/ADMDocument.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

/// What is told of one element. Names are as the document has them, not made fit for a terminal.
struct AdmNode {
    std::string_view kind; // "programme", "block", …
    std::string name;      // a block has none
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
/// Its name is that of its format, or of its channel; its details tell the rest of its chain of formats.
AdmNode describe(const ADMAudioTrackUID& track);
AdmNode describe(const ADMAudioBlockFormat& block);

/// The library keeps it unsigned, so that one below zero is a very large number there.
std::int64_t signedImportance(const ADMAudioPackFormat& pack);
