#include "adm/ADMException.h"

// Here, so that the type has one home in the library: hosts catch what the library throws.
ADMException::~ADMException() = default;
