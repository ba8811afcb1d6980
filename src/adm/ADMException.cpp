#include "adm/ADMException.h"

// Defined here so that the type has one home in the library: hosts catch what the library throws.
ADMException::~ADMException() = default;
