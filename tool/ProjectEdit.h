// The one door through which every change to a project package goes.
#pragma once

#include <functional>
#include <string>

/// Runs `edit` under a coordinated write of the package; signals that end a process wait until it is
/// done. `edit` may ask `endIsWanted` and give up. Throws Failure, also what `edit` throws.
void editProject(const std::string& package, const std::function<void()>& edit);

/// Whether a signal that ends the process is waiting for the edit to be done.
bool endIsWanted();
