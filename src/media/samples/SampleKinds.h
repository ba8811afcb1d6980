// Dispatches from a format, known at run time, to code compiled for it. For the .cpp files of the roads over samples
// only.
#pragma once

#include "media/samples/SampleConversion.h"

#include <type_traits>

namespace platform {

/// Calls `Road<Kind>::run` with the kind that `format` is, one of Integers<bytes, isBig, isUnsigned>, Floats<isBig> and
/// Doubles<isBig>; the only place that knows all of them.
template <template <class> class Road, template <int, bool, bool> class Integers, template <bool> class Floats,
          template <bool> class Doubles>
auto roadOf(SampleFormat format)
{
    const auto inOrder = [format]<bool isBig>(std::bool_constant<isBig>) {
        if (format.isFloat)
            return format.bits == 64 ? Road<Doubles<isBig>>::run : Road<Floats<isBig>>::run;
        switch (format.bits) {
        case 8:
            return format.isUnsigned ? Road<Integers<1, isBig, true>>::run : Road<Integers<1, isBig, false>>::run;
        case 16:
            return Road<Integers<2, isBig, false>>::run;
        case 24:
            return Road<Integers<3, isBig, false>>::run;
        default:
            return Road<Integers<4, isBig, false>>::run;
        }
    };
    return format.order == std::endian::big ? inOrder(std::true_type()) : inOrder(std::false_type());
}

} // namespace platform
