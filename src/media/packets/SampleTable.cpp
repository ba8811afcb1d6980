#include "media/packets/SampleTable.h"

#include "media/containers/AudioHandle.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <vector>

namespace platform {

namespace {

/// A packet's size in a box "stz2", at the start of `bytes`; sizes of 4 bits stand two to a byte, the first one higher.
std::uint32_t compactSize(BytesView bytes, unsigned bits, bool isHighHalf)
{
    if (bits == 16)
        return loadBE<std::uint16_t>(bytes.data());
    const auto byte = std::to_integer<std::uint32_t>(bytes[0]);
    if (bits == 8)
        return byte;
    return isHighHalf ? byte >> 4 : byte & 15;
}

/// A box of fixed-size entries after a count.
class Entries {
public:
    /// `countOffset` is the position of the count in the body; the entries follow it.
    Entries(PacketFile& file, const std::optional<MP4Box>& box, std::uint64_t countOffset, std::size_t entrySize)
        : file_(file),
          entrySize_(entrySize)
    {
        if (!box || box->size() < countOffset + 4)
            return;
        const BytesView count = file.at(box->body + countOffset, 4);
        if (count.size() < 4)
            return;
        start_ = box->body + countOffset + 4;
        count_ = loadBE<std::uint32_t>(count.data());
        isSound_ = (box->end - start_) / entrySize >= count_;
    }

    /// False if there is no such box, or if it has fewer entries than it counts.
    bool isSound() const { return isSound_; }
    std::uint32_t count() const { return isSound_ ? count_ : 0; }
    /// An entry's bytes, valid until the next call; empty if they cannot be read.
    BytesView at(std::uint64_t i)
    {
        const BytesView bytes = file_.at(start_ + i * entrySize_, entrySize_);
        return bytes.size() == entrySize_ ? bytes : BytesView{};
    }
    /// The 32-bit field at an offset in an entry.
    std::uint32_t number(std::uint64_t i, std::size_t offset = 0)
    {
        const BytesView bytes = at(i);
        return bytes.empty() ? 0 : loadBE<std::uint32_t>(bytes.data() + offset);
    }

private:
    PacketFile& file_;
    std::size_t entrySize_;
    std::uint64_t start_ = 0;
    std::uint32_t count_ = 0;
    bool isSound_ = false;
};

std::optional<MP4Box> child(PacketFile& file, const MP4Box& box, FourCC type)
{
    return MP4Boxes(file, box).find(type);
}

class TableReader {
public:
    TableReader(PacketFile& file, const MP4Box& box, SampleTable& table) : file_(file), box_(box), table_(table) {}

    std::int32_t run()
    {
        std::int32_t status = readSizes();
        if (status == kStatusOK)
            status = readDurations();
        if (status == kStatusOK)
            status = readChunks();
        const std::int32_t failure = file_.takeStatus();
        return failure != kStatusOK ? failure : status;
    }

private:
    std::int32_t readSizes()
    {
        if (const auto box = child(file_, box_, fourCC("stsz")))
            return readPlainSizes(*box);
        const auto box = child(file_, box_, fourCC("stz2"));
        return box ? readCompactSizes(*box) : kStatusIOError;
    }

    std::int32_t readPlainSizes(const MP4Box& box)
    {
        const BytesView fields = file_.at(box.body, 12);
        if (box.size() < 12 || fields.size() < 12)
            return kStatusIOError;
        const auto size = loadBE<std::uint32_t>(fields.data() + 4);
        table_.statedPackets = loadBE<std::uint32_t>(fields.data() + 8);
        if (size > 0) {
            table_.packets.setConstant(size, table_.statedPackets);
            return kStatusOK;
        }
        Entries sizes(file_, box, 8, 4);
        for (std::uint32_t i = 0; i < sizes.count(); ++i)
            table_.packets.append(sizes.number(i));
        return sizes.isSound() ? kStatusOK : kStatusIOError;
    }

    std::int32_t readCompactSizes(const MP4Box& box)
    {
        const BytesView fields = file_.at(box.body, 12);
        if (box.size() < 12 || fields.size() < 12)
            return kStatusIOError;
        const unsigned bits = std::to_integer<unsigned>(fields[7]);
        const auto count = loadBE<std::uint32_t>(fields.data() + 8);
        if ((bits != 4 && bits != 8 && bits != 16) || (box.size() - 12) * 8 / bits < count)
            return kStatusIOError;
        table_.statedPackets = count;
        for (std::uint64_t i = 0; i < count; ++i) {
            const BytesView bytes = file_.at(box.body + 12 + i * bits / 8, bits == 16 ? 2 : 1);
            if (bytes.empty() || bytes.size() < bits / 8)
                return kStatusIOError;
            table_.packets.append(compactSize(bytes, bits, i % 2 == 0));
        }
        return kStatusOK;
    }

    std::int32_t readDurations()
    {
        Entries durations(file_, child(file_, box_, fourCC("stts")), 4, 8);
        if (!durations.isSound())
            return kStatusIOError;
        std::uint64_t packets = 0;
        for (std::uint32_t i = 0; i < durations.count(); ++i) {
            const std::uint32_t count = durations.number(i);
            const std::uint32_t duration = durations.number(i, 4);
            if (count == 0)
                continue;
            if (packets == 0)
                table_.duration = duration;
            packets += count;
            const bool isLast = count == 1 && packets == table_.statedPackets;
            if (duration != table_.duration && !(isLast && duration < table_.duration))
                return AudioHandle::kFormatNotSupported;
            table_.lastDuration = duration;
        }
        return packets == table_.statedPackets ? kStatusOK : kStatusIOError;
    }

    struct ChunkKind {
        std::uint32_t firstChunk, packets; // chunks count from 1
    };

    std::int32_t readChunkKinds(std::vector<ChunkKind>& kinds)
    {
        Entries entries(file_, child(file_, box_, fourCC("stsc")), 4, 12);
        for (std::uint32_t i = 0; i < entries.count(); ++i) {
            const ChunkKind kind{entries.number(i), entries.number(i, 4)};
            if (entries.number(i, 8) != 1)
                return AudioHandle::kFormatNotSupported;
            if (kind.firstChunk <= (kinds.empty() ? 0 : kinds.back().firstChunk))
                return kStatusIOError;
            kinds.push_back(kind);
        }
        return entries.isSound() ? kStatusOK : kStatusIOError;
    }

    std::int32_t readChunks()
    {
        std::vector<ChunkKind> kinds;
        if (const std::int32_t status = readChunkKinds(kinds); status != kStatusOK)
            return status;
        auto box = child(file_, box_, fourCC("stco"));
        const bool is64Bit = !box;
        if (is64Bit)
            box = child(file_, box_, fourCC("co64"));
        Entries offsets(file_, box, 4, is64Bit ? 8 : 4);
        PacketIndex& packets = table_.packets;
        std::uint64_t packet = 0;
        std::size_t kind = 0;
        for (std::uint32_t i = 0; i < offsets.count() && packet < packets.count(); ++i) {
            while (kind < kinds.size() && kinds[kind].firstChunk <= i + 1)
                ++kind;
            const std::uint32_t count = kind > 0 ? kinds[kind - 1].packets : 0;
            const BytesView entry = offsets.at(i);
            if (entry.empty())
                return kStatusIOError;
            const std::uint64_t position =
                is64Bit ? loadBE<std::uint64_t>(entry.data()) : loadBE<std::uint32_t>(entry.data());
            if (count == 0)
                continue;
            const std::uint64_t end = std::min(packet + count, packets.count());
            const std::uint64_t room = file_.length() - std::min(position, file_.length());
            const std::uint64_t there = packets.countFitting(packet, end, room);
            if (there > 0)
                packets.addRun(packet, position);
            packet += there;
            if (packet < end) { // the file was cut
                packets.cut(packet);
                return kStatusOK;
            }
        }
        return packet == packets.count() ? kStatusOK : kStatusIOError;
    }

    PacketFile& file_;
    const MP4Box& box_;
    SampleTable& table_;
};

} // namespace

std::uint64_t SampleTable::totalDuration() const
{
    return packets.count() == statedPackets ? statedDuration() : packets.count() * duration;
}

std::uint64_t SampleTable::statedDuration() const
{
    return statedPackets > 0 ? statedPackets * duration - (duration - lastDuration) : 0;
}

std::int32_t SampleTable::read(PacketFile& file, const MP4Box& box, SampleTable& table)
{
    table = {};
    return TableReader(file, box, table).run();
}

} // namespace platform
