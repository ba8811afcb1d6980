// The pages of an Ogg stream (RFC 3533), and the packets that they carry.
#pragma once

#include "platform/core/Bytes.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <vector>

namespace platform {

/// A whole page with a valid checksum. Refers to bytes that it does not own.
struct OggPage {
    static constexpr std::size_t kHeaderSize = 27;
    static constexpr std::size_t kMostSize = kHeaderSize + 255 + 255 * 255;
    static constexpr std::int64_t kNoGranule = -1; // no packet ends on the page

    std::int64_t granule = kNoGranule; // where the last packet that ends here ends
    std::uint32_t serial = 0;          // of the stream
    std::uint32_t number = 0;
    bool isContinued = false; // begins inside a packet
    bool isFirst = false;     // of the stream; `isLast` likewise
    bool isLast = false;
    BytesView lacing; // segment lengths; one of less than 255 ends a packet
    BytesView body;

    /// Parses the page that the bytes begin with; none if they begin none, or end inside it.
    static std::optional<OggPage> parse(BytesView bytes);
    std::size_t size() const { return kHeaderSize + lacing.size() + body.size(); }
    bool endsPacket() const;
};

/// The last pages of the bytes, from the first whole one to the one that ends with them. Empty if there are none, or if
/// anything else stands among or after them.
std::vector<OggPage> lastOggPages(BytesView bytes);

/// Joins packets over consecutive pages.
class OggPackets {
public:
    /// Receives a packet; false if it is not acceptable.
    using Visit = std::function<bool(BytesView packet)>;

    /// Visits every packet that ends on the page, except one that began before the first page added. False if the page
    /// does not continue the last one's open packet, if a packet is too large, and if `visit` returns false.
    bool add(const OggPage& page, const Visit& visit);
    /// Whether the last packet continues on a later page.
    bool isInsidePacket() const { return isInside_; }

private:
    Bytes begun_;
    bool isInside_ = false;
    bool isWhole_ = true; // the open packet was met from its start
    bool isStart_ = true; // no page was added yet
};

} // namespace platform
