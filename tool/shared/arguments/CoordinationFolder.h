// The folder in which this command and other programs meet to coordinate, when the user chooses it.
#pragma once

#include "tool/shared/arguments/Verb.h"

/// KTFILES_COORDINATION, an absolute path; the library itself looks at no environment.
void useCoordinationFolderOfEnvironment();

/// --coordination FOLDER, which also counts for the commands that a verb runs.
void addCoordinationFolder(Verb& verb);
