// Exchanges an alternative's project data with a backup's, name by name, so that it can be completed or undone from
// wherever it was cut short. docs/formats/project-package.md tells the steps.
#pragma once

#include "platform/core/Error.h"
#include "project/ExchangeRecord.h"

class ProjectExchange {
public:
    /// Absolute paths of two folders on one file system.
    ProjectExchange(std::string alternativeFolder, std::string backupFolder);

    /// The whole exchange. False with `error`: nothing has changed, or the record is still there and the text says so.
    bool run(const std::string& backupInRecord, platform::Error* error);

    /// Brings what a record tells of to its end, or back, and forgets it. False with `error` when it cannot; when items
    /// are not what they were, nothing is moved, and the record is forgotten.
    bool complete(const ExchangeRecord& record, platform::Error* error) { return settle(record, Side::there, error); }
    bool undo(const ExchangeRecord& record, platform::Error* error) { return settle(record, Side::back, error); }

    /// Whether every item is where the exchange wanted it.
    bool isComplete(const ExchangeRecord& record) const;

private:
    enum class Side { there, back };
    struct Places {
        std::string alternative, backup, staged;
    };
    struct Found {
        std::uint64_t alternative = 0, backup = 0, staged = 0;
    };

    Places placesOf(const std::string& name) const;
    static bool look(const Places& places, Found& found);
    static bool isConflict(const ExchangeItem& item, const Found& found);
    bool settle(const ExchangeRecord& record, Side side, platform::Error* error);
    bool move(const ExchangeRecord& record, Side side) const;
    bool moveItem(const ExchangeItem& item, Side side) const;
    bool step(const ExchangeItem& item, Side side, const Places& places, const Found& found) const;
    bool forget();
    bool sync() const;

    std::string alternativeFolder_;
    std::string backupFolder_;
};
