// A command run on behalf of a verb, as a shell would run it.
#pragma once

#include <string>
#include <vector>

/// Runs the command and waits for its end. SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGUSR1 and SIGUSR2 go on to it, unless
/// they come from the terminal, which sends them to both. Gives its exit status: 128 + N when signal N ended it; 127
/// when there is no such command and 126 when it cannot be run, after a line on standard error.
int runChild(const std::vector<std::string>& words);
