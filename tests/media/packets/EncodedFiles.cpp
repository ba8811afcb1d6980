#include "media/packets/EncodedFiles.h"

#include "platform/core/ByteWriter.h"
#include "support/Programs.h"

#include <gtest/gtest.h>

#include <map>
#include <random>

namespace {

const TemporaryFolder& folder()
{
    static const TemporaryFolder made;
    return made;
}

/// Noise without the highest frequencies, as a WAVE file.
std::string waveOf(const Sound& sound)
{
    const std::string name =
        std::to_string(sound.frames) + "-" + std::to_string(sound.rate) + "-" + std::to_string(sound.channels) + ".wav";
    if (std::filesystem::exists(folder() / name))
        return folder() / name;
    const std::uint32_t bytes = sound.frames * sound.channels * 2;
    ByteWriter out(std::endian::little);
    out.writeFourCC(fourCC("RIFF"));
    out.write(std::uint32_t{36} + bytes);
    out.write(bytesOf("WAVEfmt "));
    out.write(std::uint32_t{16});
    out.write(std::uint16_t{1});
    out.write(static_cast<std::uint16_t>(sound.channels));
    out.write(sound.rate);
    out.write(sound.rate * sound.channels * 2);
    out.write(static_cast<std::uint16_t>(sound.channels * 2));
    out.write(std::uint16_t{16});
    out.write(bytesOf("data"));
    out.write(bytes);
    std::minstd_rand random(sound.frames + 1);
    std::uniform_real_distribution<double> step(-1, 1);
    double value = 0;
    for (std::uint32_t i = 0; i < sound.frames; ++i) {
        value = 0.9 * value + 0.1 * step(random);
        for (std::uint32_t channel = 0; channel < sound.channels; ++channel)
            out.write(static_cast<std::int16_t>(value * 30000));
    }
    return folder().write(name, out.view());
}

std::string replaced(std::string text, const std::string& what, const std::string& with)
{
    const std::size_t at = text.find(what);
    return at == std::string::npos ? text : text.replace(at, what.size(), with);
}

} // namespace

std::string encoded(const std::string& command, const std::string& extension, const Sound& sound)
{
    static std::map<std::string, std::string> made;
    const std::string source = waveOf(sound);
    std::string& path = made[command + extension + source];
    if (path.empty()) {
        path = folder() / ("encoded-" + std::to_string(made.size()) + "." + extension);
        const std::string line = replaced(replaced(command, "IN", "'" + source + "'"), "OUT", "'" + path + "'");
        EXPECT_TRUE(runs(folder(), line)) << line;
    }
    return path;
}

std::unique_ptr<platform::PacketSource> opened(const std::string& path)
{
    std::int32_t status = 0;
    auto source = platform::openPacketSource(path, &status);
    EXPECT_TRUE(source) << path << ": " << status;
    return source;
}

std::int32_t refusal(const std::string& path)
{
    std::int32_t status = 0;
    return platform::openPacketSource(path, &status) ? 0 : status;
}

Bytes allPackets(platform::PacketSource& source)
{
    Bytes all, packet;
    for (std::uint64_t i = 0; i < source.packetCount(); ++i) {
        EXPECT_EQ(source.read(i, packet), 0) << i;
        all.insert(all.end(), packet.begin(), packet.end());
    }
    return all;
}
