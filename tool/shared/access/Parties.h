// Describes in words who presents, holds and awaits files.
#pragma once

#include "platform/FileCoordination.h"

#include <optional>
#include <string>

/// The command name of a process; empty if the process is gone.
std::string processName(int processID);

/// Describes what an access to the item waits for: "process 12 (bounce)", "processes 12 (bounce) and 34 (mixer)", or
/// "another process" if none is visible.
std::string blockersText(const platform::CoordinatedItem& item, bool isWriting);

/// Describes processes that have locked the open file itself, as programs do that know nothing of coordination:
/// "process 12 (bounce), which has locked it for reading", or "another process, which has locked it" if none is
/// visible.
std::string lockersText(int descriptor);

/// Tells the commands that this process will run that it waits for them, and what it locks.
void announceLock();

/// The lock on the item of a `ktfiles lock` that runs this process. It waits for us, so waiting for it would never end.
/// If there are locks for reading and for writing, the latter.
std::optional<platform::CoordinationParty> lockAbove(const platform::CoordinatedItem& item);
