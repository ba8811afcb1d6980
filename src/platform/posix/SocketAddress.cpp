#include "platform/posix/SocketAddress.h"

#include <cstddef>

#include <sys/socket.h>
#include <sys/un.h>

namespace platform {

SocketAddress::SocketAddress(const std::string& path)
{
    static_assert(sizeof bytes_ == sizeof(sockaddr_un));
    auto* address = reinterpret_cast<sockaddr_un*>(bytes_);
    address->sun_family = AF_UNIX;
    path.copy(address->sun_path, sizeof address->sun_path - 1);
}

} // namespace platform
