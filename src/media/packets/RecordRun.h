// The records that stand at the end of a file, one behind the other: pages of Ogg, blocks of WavPack.
#pragma once

#include "media/packets/PacketFile.h"

#include <algorithm>
#include <optional>
#include <string_view>
#include <vector>

namespace platform {

/// The last records of the bytes, in their order, from the first one that is whole on to the one that ends with them.
/// Each begins with `marker`, and Record::parse() proves that it is one. Empty when there are none, or something else
/// stands among or behind them.
template <class Record>
std::vector<Record> recordsToTheEnd(BytesView bytes, std::string_view marker)
{
    constexpr int mostTries =
        3; // a marker that begins no record stands by chance in a file of gigabytes, or on purpose
    std::vector<Record> records;
    for (int tries = 0; tries < mostTries; ++tries) {
        const std::size_t at = textOf(bytes).find(marker);
        if (at == std::string_view::npos)
            return {};
        bytes = bytes.subspan(at);
        while (const std::optional<Record> record = Record::parse(bytes)) {
            records.push_back(*record);
            bytes = bytes.subspan(record->size());
        }
        if (!records.empty())
            return bytes.empty() ? records : std::vector<Record>();
        bytes = bytes.subspan(marker.size());
    }
    return {};
}

/// The last bytes of a stretch of a file, as many as are needed.
class FileTail {
public:
    /// Of the file from `start` to `end`. Does not own it.
    FileTail(PacketFile& file, std::uint64_t start, std::uint64_t end) : file_(file), start_(start), end_(end) {}

    /// Reads so many bytes, then always twice as many; false when all were read before, when they are too many, and
    /// when they cannot be read, with the status.
    bool grow(std::int32_t& status)
    {
        constexpr std::size_t first = std::size_t{1} << 17, most = std::size_t{1} << 23;
        const std::uint64_t all = end_ - start_;
        if (bytes_.size() == all || bytes_.size() >= most)
            return false;
        status = file_.read(end_ - std::min<std::uint64_t>(all, std::max(first, 2 * bytes_.size())),
                            std::min<std::uint64_t>(all, std::max(first, 2 * bytes_.size())), bytes_);
        return status == 0;
    }
    BytesView bytes() const { return bytes_; }
    bool isAll() const { return bytes_.size() == end_ - start_; }

private:
    PacketFile& file_;
    std::uint64_t start_, end_;
    Bytes bytes_;
};

} // namespace platform
