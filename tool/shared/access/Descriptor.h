// A file descriptor that closes itself, and how regular files are opened.
#pragma once

#include <string>
#include <unistd.h>
#include <utility>

class Descriptor {
public:
    Descriptor() = default;
    explicit Descriptor(int number) : number_(number) {}
    Descriptor(Descriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
    Descriptor& operator=(Descriptor&& other) noexcept
    {
        std::swap(number_, other.number_);
        return *this;
    }
    ~Descriptor()
    {
        if (number_ >= 0)
            ::close(number_);
    }

    int get() const { return number_; }
    explicit operator bool() const { return number_ >= 0; }

private:
    int number_ = -1;
};

/// A path that leads to the open file itself in this process: what has its name meanwhile, or stands on the way to it,
/// does not matter.
inline std::string pathOfDescriptor(int descriptor)
{
    return "/proc/self/fd/" + std::to_string(descriptor);
}

/// Opens what must be a regular file, with O_RDONLY or O_RDWR. It is looked at first, by way of the same descriptor: a
/// FIFO or device is never opened, and a file under a lease of another process is waited for, as every open does. Empty
/// with errno on failure; ENXIO for what is no regular file.
Descriptor openRegularFile(const std::string& path, int access);
