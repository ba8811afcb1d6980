// The one door through which every change to a project package goes.
#pragma once

#include "tool/shared/access/Waiting.h"

#include <functional>
#include <string>

/// Runs `edit` with the package's path, every symbolic link resolved, under a coordinated write of it: what is locked
/// is what is looked at and changed, whatever becomes of the links meanwhile. Signals that end a process wait until it
/// is done; `edit` may ask `endIsWanted` and give up. Throws Failure, also what `edit` throws.
void editProject(const std::string& package, const WaitOptions& wait,
                 const std::function<void(const std::string& package)>& edit);

/// Whether a signal that ends the process is waiting for the edit to be done.
bool endIsWanted();
