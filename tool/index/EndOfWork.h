// Long work that ends in good order when a signal asks for it.
#pragma once

/// From its construction on, SIGINT, SIGTERM, SIGHUP and their like are noted, and a second one ends the process.
class EndOfWork {
public:
    EndOfWork();

    static bool isAsked();
    /// Ends the process by the signal that was noted, if there was one.
    static void endIfAsked();
};
