#include "media/containers/ContainerTraits.h"

#include <algorithm>
#include <span>

namespace platform {

namespace {

struct Role {
    FourCC id;
    ChunkRole role;
};

constexpr Role riff[] = {{fourCC("fmt "), ChunkRole::essential},
                         {fourCC("data"), ChunkRole::essential},
                         {fourCC("ds64"), ChunkRole::essential},
                         {fourCC("fact"), ChunkRole::supporting},
                         {fourCC("JUNK"), ChunkRole::filler}};
constexpr Role iff[] = {{fourCC("COMM"), ChunkRole::essential},
                        {fourCC("SSND"), ChunkRole::essential},
                        {fourCC("FVER"), ChunkRole::supporting}};
constexpr Role caf[] = {{fourCC("desc"), ChunkRole::essential},
                        {fourCC("data"), ChunkRole::essential},
                        {fourCC("pakt"), ChunkRole::essential},
                        {fourCC("kuki"), ChunkRole::essential},
                        {fourCC("chan"), ChunkRole::supporting}};
constexpr Role rex2[] = {{fourCC("HEAD"), ChunkRole::essential}};

std::span<const Role> rolesIn(ContainerKind kind)
{
    switch (kind) {
    case ContainerKind::riff:
        return riff;
    case ContainerKind::iff:
        return iff;
    case ContainerKind::caf:
        return caf;
    case ContainerKind::rex2:
        return rex2;
    case ContainerKind::wave64:
    case ContainerKind::au:
        break;
    }
    return {};
}

} // namespace

ChunkRole roleOfChunk(ContainerKind kind, FourCC id)
{
    const std::span<const Role> roles = rolesIn(kind);
    if (const auto found = std::ranges::find(roles, id, &Role::id); found != roles.end())
        return found->role;
    return id == fourCC("free") ? ChunkRole::filler : ChunkRole::userData;
}

} // namespace platform
