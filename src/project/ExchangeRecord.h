// The record of an exchange of project data: which items stood where before it began. It lies in the alternative's
// folder as long as the exchange is under way, so that one that was cut short can be told, completed or undone.
#pragma once

#include "platform/core/Error.h"

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

/// One name that changes places. Renaming keeps an item's inode number, by which it is found again; 0 for no item.
struct ExchangeItem {
    std::string name;
    std::uint64_t inAlternative = 0;
    std::uint64_t inBackup = 0;
    friend bool operator==(const ExchangeItem&, const ExchangeItem&) = default;
};

/// What takes part, in this order: an autosave must not outlive the data that it belongs to.
inline constexpr std::array<const char*, 5> kExchangedNames{"Autosave", "ProjectData", "ARA Files", "MetaData.plist",
                                                            "MetaData.bak"};

struct ExchangeRecord {
    /// The name of a folder among the alternative's backups, else an absolute path.
    std::string backup;
    /// One for each of the names.
    std::vector<ExchangeItem> items;

    Bytes bytes() const;
    /// Null unless it is just what `bytes` writes: a package may come from anywhere, and its record moves files.
    static std::optional<ExchangeRecord> fromBytes(BytesView bytes);

    static std::string pathIn(const std::string& alternativeFolder);
    /// Makes it durable under its name, which nothing must have; false with errno, and nothing left behind.
    bool write(const std::string& alternativeFolder) const;
};
