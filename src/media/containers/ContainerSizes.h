// The size fields of a container: which of them to rewrite when the container or one of its chunks gets another size.
#pragma once

#include "media/containers/ContainerLayout.h"

namespace platform {

/// 0, or kStatusFileTooBig when the container cannot state that it ends at `end`. A RIFF file can pass 4 GiB when it
/// has a reservation ("JUNK") or a "ds64"; an IFF file holds 2 GiB, as its sizes are signed.
std::int32_t checkContainerEnd(const ContainerLayout& layout, std::uint64_t end);

/// Makes the container end at `end`, by one write: 4 bytes at offset 4, 8 bytes in the "ds64", or the 48 bytes that
/// turn RIFF with a reservation into RF64. Nothing for CAF, which ends with its file.
std::int32_t writeContainerEnd(const FileBytes& file, const ContainerLayout& layout, std::uint64_t end);

/// Makes `chunk`, which is the last of the layout, state the size `size`, and the layout with it.
std::int32_t writeLastChunkSize(const FileBytes& file, ContainerLayout& layout, std::uint64_t size);

/// Makes an open or stale size of the last chunk its real one, with the pad byte that it lacks, so that another chunk
/// can stand behind it.
std::int32_t settleLastChunk(const FileBytes& file, ContainerLayout& layout);

/// Whether bytes stand behind the container that no edit of ours left there when it was cut short.
bool hasForeignTail(const FileBytes& file, const ContainerLayout& layout);

} // namespace platform
