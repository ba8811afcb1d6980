// Exchanges an alternative's project data with a backup's, name by name, so that an interrupted exchange can be
// completed or undone. docs/formats/project-package.md lists the steps.
#pragma once

#include "platform/core/Error.h"
#include "project/ExchangeRecord.h"

/// One exchange between two folders.
class ProjectExchange {
public:
    /// Takes absolute paths of two folders on one file system.
    ProjectExchange(std::string alternativeFolder, std::string backupFolder);

    /// Runs the whole exchange. False with `error`: nothing has changed, or the record is still there and the text
    /// says so.
    bool run(const std::string& backupInRecord, platform::Error* error);

    /// Completes the exchange of a record, and removes the record. False with `error` when that fails; when items are
    /// not what the record says, nothing is moved, and the record is removed.
    bool complete(const ExchangeRecord& record, platform::Error* error) { return settle(record, Side::there, error); }
    /// Undoes the exchange of a record, and removes the record. Fails as complete() does.
    bool undo(const ExchangeRecord& record, platform::Error* error) { return settle(record, Side::back, error); }

    /// Whether every item is where the exchange wants it.
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
