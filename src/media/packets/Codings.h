// What is to be known of codings by their ids, whatever container they are in.
#pragma once

#include "platform/core/FourCC.h"

#include <cstdint>

namespace platform {

/// Codings that are named, but that nothing here decodes: locked sounds, and those that hosts do not take.
inline bool isOpaqueCoding(FourCC coding)
{
    return coding == fourCC("sac1") || coding == fourCC("sal1") || coding == fourCC("enca") || coding == fourCC("drms");
}

/// As PacketSource::preRoll, of codings whose packets do not tell: AAC needs the one that overlaps, "ima4" all of them,
/// since the low bits of its predictor run on from the first.
inline std::uint64_t constantPreRoll(FourCC coding, std::uint64_t packet)
{
    return coding == fourCC("ima4") ? packet : coding == fourCC("aac ") && packet > 0 ? 1 : 0;
}

} // namespace platform
