// Fields of a file's records between the order of the file and the host's.
#pragma once

#include "platform/core/Packed.h"

/// Turns each from `order` to the host's, or back; nothing where they are the same.
template <class... T>
void turnFields(std::endian order, Packed<T>&... fields)
{
    ((fields = load<T>(&fields, order)), ...);
}
