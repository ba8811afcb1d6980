// Files in compressed formats, made by the programs that people make them with, each once for all tests.
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

/// The path of a file that `command` makes of noise of that kind, with "IN" for a WAVE file and "OUT" for the result.
/// Fails the running test when the command fails.
std::string encoded(const std::string& command, const std::string& extension, const Sound& sound);

/// What openPacketSource() gives of a file; fails the running test when it gives none.
std::unique_ptr<platform::PacketSource> opened(const std::string& path);
/// The status with which a file is refused; 0 when it is not.
std::int32_t refusal(const std::string& path);
/// All packets of a source, one behind the other.
Bytes allPackets(platform::PacketSource& source);
