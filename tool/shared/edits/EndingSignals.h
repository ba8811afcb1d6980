// What happens to half-done files when a signal ends the command.
#pragma once

/// From now on SIGINT, SIGTERM, SIGHUP and their like remove the temporary files of this process before they end it.
/// Ahead of making one.
void removeTemporaryFilesAtEndingSignals();
