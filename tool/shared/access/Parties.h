// Who presents, holds and waits for files, in words.
#pragma once

#include "platform/FileCoordination.h"

#include <optional>
#include <string>

/// The command name of a process; empty when the process is gone.
std::string processName(int processID);

/// Those that an access to the item waits for: "process 12 (bounce)", "processes 12 (bounce) and 34 (mixer)". When none
/// is to be seen, "another process".
std::string blockersText(const platform::CoordinatedItem& item, bool isWriting);

/// Those that have locked the open file itself, as other programs do, though they know nothing of coordination:
/// "process 12 (bounce), which has locked it for reading". When none is to be seen, "another process, which has locked
/// it".
std::string lockersText(int descriptor);

/// Lets the commands that this process will run know that it waits for them, with what it locks.
void announceLock();

/// What a `ktfiles lock` that runs this process has of the item: it waits for us, so that nobody here must wait for it.
/// Of a lock for reading and one for writing, the latter.
std::optional<platform::CoordinationParty> lockAbove(const platform::CoordinatedItem& item);
