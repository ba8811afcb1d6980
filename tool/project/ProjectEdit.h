// The only way to change a project package.
#pragma once

#include "tool/shared/access/Waiting.h"

#include <functional>
#include <string>

/// Runs `edit` with the package's path, symbolic links resolved, during a coordinated write of it: what is locked is
/// what is examined and changed, even if links change meanwhile. Signals that end the process wait until it is done;
/// `edit` may check `endIsWanted` and stop. Throws Failure, and what `edit` throws.
void editProject(const std::string& package, const WaitOptions& wait,
                 const std::function<void(const std::string& package)>& edit);

/// Whether a signal that ends the process is waiting for the edit to finish.
bool endIsWanted();
