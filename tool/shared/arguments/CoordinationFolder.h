// The user's choice of the folder in which this command and other programs coordinate.
#pragma once

#include "tool/shared/arguments/Verb.h"

/// Uses KTFILES_COORDINATION, an absolute path; the library itself ignores the environment.
void useCoordinationFolderOfEnvironment();

/// Adds --coordination FOLDER, which also applies to the commands that a verb runs.
void addCoordinationFolder(Verb& verb);
