#include "adm/ADMTimestamp.h"

#include <gtest/gtest.h>

namespace {

constexpr std::int64_t kHour = 3600000000;

TEST(ADMTimestamp, TextsToMicroseconds)
{
    const struct {
        std::optional<std::string_view> text;
        std::int64_t time, exact;
    } rows[] = {
        {"00:00:10.00000", 10000000, 10000000},
        {"01:00:00.00000S48000", kHour, kHour},
        {"00:00:00.24000S48000", 500000, 500000},
        {"00:00:01.5", 1000050, 1500000}, // a count of 1/100000 s, whatever its digits
        {"00:00:00.1234567890123", 12345678901230, 123456},
        {"00:00:00.01234", 12340, 12340},
        {"99:99:99.99999", 99 * kHour + 99 * 60000000LL + 99999990, 99 * kHour + 99 * 60000000LL + 99999990},
        {" 1: 2:\t3. 4", kHour + 123000040, kHour + 123400000},
        {"-1:00:00.0", -kHour, -kHour},
        {"+1:+0:+0.+0", kHour, kHour},
        {"00:00:00.10000S48000 and more", 208333, 208333},
        {"00:00:00.10000X", 100000, 100000},
        {"00:00:00.1S-10", -100000, -100000},
        {"00:00:00.0000000000000000000000000000000000000000001", 10, 0},
        {{}, kADMInvalidTime, kADMInvalidTime},
        {"", kADMInvalidTime, kADMInvalidTime},
        {"10.5", kADMInvalidTime, kADMInvalidTime},
        {"00:00:10", kADMInvalidTime, kADMInvalidTime},
        {"00:00:10.", kADMInvalidTime, kADMInvalidTime},
        {"0:00:1O.00000", kADMInvalidTime, kADMInvalidTime},
        {"+-1:00:00.0", kADMInvalidTime, kADMInvalidTime},
        {"00:00:00.1S", kADMInvalidTime, kADMInvalidTime},
        {"00:00:00.1S0", kADMInvalidTime, kADMInvalidTime},
        {"9999999999:00:00.0", kADMInvalidTime, kADMInvalidTime},
        {"99999999999999999999:00:00.0", kADMInvalidTime, kADMInvalidTime},
        {"00:00:00.9223372036854775807", kADMInvalidTime, 922337},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(ADMTimestampStringToMicroSeconds(row.text), row.time) << row.text.value_or("(null)");
        EXPECT_EQ(ADMTimestampStringToExactMicroSeconds(row.text), row.exact) << row.text.value_or("(null)");
    }
}

TEST(ADMTimestamp, MicrosecondsToText)
{
    const struct {
        std::int64_t time;
        const char* text;
    } rows[] = {
        {0, "00:00:00.00000"},
        {1234567, "00:00:01.23457"},
        {999994, "00:00:00.99999"},
        {999995, "00:00:00.10000"},
        {999999, "00:00:00.10000"},
        {kHour * 100 + 61000004, "100:01:01.00000"},
        {4 * kHour - 1, "03:59:59.10000"},
        {-kHour, "-1:00:00.00000"},
    };
    for (const auto& row : rows)
        EXPECT_EQ(ADMTimeMicrosecToTimestampString(row.time), row.text);
}

} // namespace
