// The pages of an Ogg stream (RFC 3533), and the packets that they carry.
#pragma once

#include "platform/core/Bytes.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <vector>

namespace platform {

/// A page that is whole and has the right checksum. Looks at bytes that it does not own.
struct OggPage {
    static constexpr std::size_t kHeaderSize = 27;
    static constexpr std::size_t kMostSize = kHeaderSize + 255 + 255 * 255;
    static constexpr std::int64_t kNoGranule = -1; // of a page on which no packet ends

    std::int64_t granule = kNoGranule; // where the last packet ends that ends here
    std::uint32_t serial = 0;          // of the stream
    std::uint32_t number = 0;
    bool isContinued = false; // begins inside a packet
    bool isFirst = false;     // of the stream, and the last
    bool isLast = false;
    BytesView lacing; // the lengths of the body's segments; one of less than 255 ends a packet
    BytesView body;

    /// The one that the bytes begin with; none when they begin with none, or do not reach to its end.
    static std::optional<OggPage> parse(BytesView bytes);
    std::size_t size() const { return kHeaderSize + lacing.size() + body.size(); }
    bool endsPacket() const;
};

/// The last pages of the bytes, from the first one that is whole on to the one that ends with them. Empty when there
/// are none, or something else stands among or behind them.
std::vector<OggPage> lastOggPages(BytesView bytes);

/// Joins the packets of pages that follow one another.
class OggPackets {
public:
    /// What is done with a packet; false when it is none.
    using Visit = std::function<bool(BytesView packet)>;

    /// Every packet that ends on the page is visited, but for one that began ahead of the first page added. False when
    /// the page does not continue what the last one began, for a packet that is too large, and when `visit` says so.
    bool add(const OggPage& page, const Visit& visit);
    /// Whether a packet ends on a page that is still to come.
    bool isInsidePacket() const { return isInside_; }

private:
    Bytes begun_;
    bool isInside_ = false;
    bool isWhole_ = true; // the packet that is begun: all of it was met
    bool isStart_ = true; // no page was added
};

} // namespace platform
