// The same program for a C++ compiler, which takes the header as it is.
#include "Interface.c" // NOLINT(bugprone-suspicious-include)
