// The record of an exchange of project data: which items stood where before it began. It lies in the alternative's
// folder while the exchange is under way, so that an interrupted one can be recognised, completed or undone.
#pragma once

#include "platform/core/Error.h"

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

/// One name whose items change places. Renaming keeps an item's inode number, which identifies it; 0 for no item.
struct ExchangeItem {
    std::string name;                // one of kExchangedNames
    std::uint64_t inAlternative = 0; // the inode number before the exchange
    std::uint64_t inBackup = 0;      // the inode number before the exchange
    friend bool operator==(const ExchangeItem&, const ExchangeItem&) = default;
};

/// The names that take part, in this order, since an autosave must not outlive the data that it belongs to.
inline constexpr std::array<const char*, 5> kExchangedNames{"Autosave", "ProjectData", "ARA Files", "MetaData.plist",
                                                            "MetaData.bak"};

/// What an interrupted exchange leaves to be read.
struct ExchangeRecord {
    /// The name of a folder among the alternative's backups, else an absolute path.
    std::string backup;
    /// One for each of kExchangedNames.
    std::vector<ExchangeItem> items;

    /// The record as a property list.
    Bytes bytes() const;
    /// The record that bytes() wrote; null for any other bytes. A package may come from anywhere, and its record
    /// moves files.
    static std::optional<ExchangeRecord> fromBytes(BytesView bytes);

    /// The path of the record in an alternative's folder.
    static std::string pathIn(const std::string& alternativeFolder);
    /// Writes the record durably. False, with errno, and nothing left behind, on failure and when the file exists.
    bool write(const std::string& alternativeFolder) const;
};
