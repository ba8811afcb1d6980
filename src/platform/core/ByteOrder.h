// Fields of records, turned between the byte order of a file and the host's.
#pragma once

#include "platform/core/Packed.h"

/// Turns each field from `order` to the host's byte order, or back; does nothing where they are the same.
template <class... T>
void turnFields(std::endian order, Packed<T>&... fields)
{
    ((fields = load<T>(&fields, order)), ...);
}
