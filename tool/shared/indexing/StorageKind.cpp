#include "tool/shared/indexing/StorageKind.h"

#include <algorithm>
#include <cstdint>
#include <iterator>
#include <sys/vfs.h>

namespace {

// As <linux/magic.h> has them, and those that only the sources of the file systems have.
constexpr std::uint32_t kNetworkKinds[] = {
    0x00006969, // NFS
    0x0000517b, // SMB
    0xff534d42, // CIFS
    0xfe534d42, // SMB 2
    0x65735546, // FUSE
    0x01021997, // 9P
    0x5346414f, // AFS
    0x6b414653, // AFS, in the kernel
    0x73757245, // Coda
    0x0000564c, // NCP
    0x00c36400, // Ceph
    0x0bd00bd0, // Lustre
    0x47504653, // GPFS
    0x01161970, // GFS2
    0x7461636f, // OCFS2
    0xaad7aaea, // PanFS
    0x786f4256, // folders that a virtual machine shares
};

// Numbers of inodes are made up while the file system is mounted, or may be.
constexpr std::uint32_t kMadeUpInodeKinds[] = {
    0x00004d44, // FAT
    0x2011bab0, // exFAT
    0x65735546, // FUSE
    0x0000517b, // SMB
    0xff534d42, // CIFS
    0xfe534d42, // SMB 2
    0x786f4256, // folders that a virtual machine shares
};

template <std::size_t count>
bool isOfKind(const std::string& folder, const std::uint32_t (&kinds)[count])
{
    struct statfs status = {};
    return ::statfs(folder.c_str(), &status) == 0 &&
           std::ranges::find(kinds, static_cast<std::uint32_t>(status.f_type)) != std::end(kinds);
}

} // namespace

bool isOnNetwork(const std::string& folder)
{
    return isOfKind(folder, kNetworkKinds);
}

bool haveLastingInodes(const std::string& folder)
{
    return !isOfKind(folder, kMadeUpInodeKinds);
}
