// Runs a command on behalf of a verb, as a shell would.
#pragma once

#include <string>
#include <vector>

/// Runs the command and waits for its end. SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGUSR1 and SIGUSR2 are passed on, unless
/// they come from the terminal, which sends them to both. Returns the exit status: 128 + N if signal N ended it; 127 if
/// there is no such command and 126 if it cannot be run, after a line on standard error.
int runChild(const std::vector<std::string>& words);
