// Compressed files made by common programs, each once for all tests.
#pragma once

#include "media/packets/PacketSource.h"
#include "support/TemporaryFolder.h"

#include <cstdint>
#include <string>

struct Sound {
    std::uint32_t frames = 44100;
    std::uint32_t rate = 44100;
    std::uint32_t channels = 2;
};

/// The path of a file that `command` makes of such noise; "IN" stands for a WAVE file and "OUT" for the result. Fails
/// the running test if the command fails.
std::string encoded(const std::string& command, const std::string& extension, const Sound& sound);

/// The result of openPacketSource() for a file; fails the running test if there is none.
std::unique_ptr<platform::PacketSource> opened(const std::string& path);
/// The status with which a file is refused; 0 if it is accepted.
std::int32_t refusal(const std::string& path);
/// All packets of a source, concatenated.
Bytes allPackets(platform::PacketSource& source);
