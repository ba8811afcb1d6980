// Records of fixed size between their bytes and host order. A record is made of Packed members, in the order of the
// file; its `byteOrder` turns those that are numbers from the order of the file to the host's, or back.
#pragma once

#include "platform/core/ByteOrder.h"
#include "platform/core/ByteReader.h"
#include "platform/core/ByteWriter.h"

#include <algorithm>
#include <optional>
#include <vector>

/// The next record, in host order; null, and nothing taken, when fewer bytes are left.
template <class Record>
std::optional<Record> takeRecord(ByteReader& reader, std::endian order)
{
    if (reader.remaining() < sizeof(Record))
        return std::nullopt;
    Record record;
    static_assert(std::is_trivially_copyable_v<Record> && alignof(Record) == 1);
    std::memcpy(&record, reader.take(sizeof record).data(), sizeof record);
    record.byteOrder(order);
    return record;
}

/// As many of `stated` records as there are.
template <class Record>
std::vector<Record> takeRecords(ByteReader& reader, std::uint32_t stated, std::endian order)
{
    const std::size_t count = std::min<std::size_t>(stated, reader.remaining() / sizeof(Record));
    std::vector<Record> records;
    records.reserve(count);
    while (records.size() < count)
        records.push_back(*takeRecord<Record>(reader, order));
    return records;
}

/// Appends a record, turned from host order to `order`.
template <class Record>
void putRecord(ByteWriter& writer, Record record, std::endian order)
{
    record.byteOrder(order);
    writer.write(std::as_bytes(std::span(&record, 1)));
}

/// A copy of the bytes that are left.
inline Bytes takeRest(ByteReader& reader)
{
    const BytesView rest = reader.take(reader.remaining());
    return {rest.begin(), rest.end()};
}
