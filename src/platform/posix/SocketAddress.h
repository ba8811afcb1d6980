// The address of a socket in the file system. For implementation files only, since it contains a system structure.
#pragma once

#include <string>

struct sockaddr;

namespace platform {

class SocketAddress {
public:
    /// A path that is too long for an address is cut, and so names nothing.
    explicit SocketAddress(const std::string& path);

    const sockaddr* get() const { return reinterpret_cast<const sockaddr*>(bytes_); }
    unsigned size() const { return sizeof bytes_; }

private:
    alignas(8) char bytes_[110] = {};
};

} // namespace platform
