// The size fields that must change when a container or its last chunk gets another size.
#pragma once

#include "media/containers/ContainerLayout.h"

namespace platform {

/// kStatusFileTooBig if the container cannot state that it ends at `end`, else 0. A RIFF file can exceed 4 GiB if it
/// has a reservation ("JUNK") or a "ds64"; an IFF file holds 2 GiB, since its sizes are signed.
std::int32_t checkContainerEnd(const ContainerLayout& layout, std::uint64_t end);

/// Makes the container end at `end` with one write: 4 bytes at offset 4, 8 bytes in the "ds64", or the 48 bytes that
/// turn RIFF with a reservation into RF64. Does nothing for CAF, which ends with its file.
std::int32_t writeContainerEnd(const FileBytes& file, const ContainerLayout& layout, std::uint64_t end);

/// Sets the size of `chunk`, the last one, in the file and in the layout.
std::int32_t writeLastChunkSize(const FileBytes& file, ContainerLayout& layout, std::uint64_t size);

/// Replaces an open or stale size of the last chunk by its real one and adds a missing pad byte, so that another chunk
/// can follow.
std::int32_t settleLastChunk(const FileBytes& file, ContainerLayout& layout);

/// Whether bytes follow the container that no interrupted edit of ours left there.
bool hasForeignTail(const FileBytes& file, const ContainerLayout& layout);

} // namespace platform
