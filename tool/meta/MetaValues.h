// Parses values of metadata fields as people type them.
#pragma once

#include "platform/core/Bytes.h"
#include "tool/shared/output/ClockTime.h"

#include <cstdint>
#include <string>
#include <variant>

/// A position in the sound: frames, a time, or a time code with its frame rate.
struct MetaTime {
    SoundLength length;
    // For a time code, in pictures of `numerator` / `denominator` seconds.
    std::int64_t pictures = -1;
    std::int64_t numerator = 1, denominator = 1;

    bool isFrames() const { return pictures < 0 && !length.seconds; }
    /// In frames, rounded to the nearest.
    std::uint64_t at(double sampleRate) const;
};

/// "48000", "1.5s", "1:02:03.5", "01:00:00:00@25"; 24, 25, 30, 48, 50 and 60 pictures per second, 23.976, 29.97 and
/// 59.94, the latter two with ";" before the pictures as drop-frame code. Throws UsageError.
MetaTime metaTimeFromText(const std::string& text);

enum class MetaKind {
    none,        // cannot be set, only removed
    text,        // UTF-8, `most` bytes
    line,        // ASCII on one line, `most` bytes
    ascii,       // ASCII with line ends
    date,        // 2026-11-22
    clock,       // 10:44:00
    umid,        // 32 or 64 bytes in hexadecimal
    digest,      // 16 bytes in hexadecimal
    time,        // MetaTime
    integer,     // from `least` to `most`
    decimal,     // likewise
    id,          // four characters
    loopType,    // forward, alternating, backward, or a number
    smpteOffset, // hh:mm:ss:ff
    moment       // seconds since 1904, or a date
};

struct MetaRange {
    double least = 0, most = 0;
};
inline constexpr MetaRange kAnyLength{0, 1e9}, kUnsigned16{0, 65535}, kUnsigned32{0, 4294967295.0};

/// Ids, types, offsets and moments are numbers as in chunks; nothing for a removal.
using MetaValue = std::variant<std::monostate, std::string, std::int64_t, double, MetaTime, Bytes>;

/// `isLenient` accepts texts, dates and labels that the standards forbid, but never more bytes than fit. Throws
/// UsageError; the caller adds the field's name.
MetaValue metaValueFromText(MetaKind kind, MetaRange range, const std::string& text, bool isLenient);
