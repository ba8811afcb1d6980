// Facts about codings by id, whatever the container.
#pragma once

#include "platform/core/FourCC.h"

#include <cstdint>

namespace platform {

/// Codings with a name that nothing here decodes: protected sound, and codings that hosts do not accept.
inline bool isOpaqueCoding(FourCC coding)
{
    return coding == fourCC("sac1") || coding == fourCC("sal1") || coding == fourCC("enca") || coding == fourCC("drms");
}

/// As PacketSource::preRoll, for codings whose packets do not tell: AAC needs the overlapping one; "ima4" needs all,
/// since the low bits of its predictor carry on from the first.
inline std::uint64_t constantPreRoll(FourCC coding, std::uint64_t packet)
{
    return coding == fourCC("ima4") ? packet : coding == fourCC("aac ") && packet > 0 ? 1 : 0;
}

} // namespace platform
