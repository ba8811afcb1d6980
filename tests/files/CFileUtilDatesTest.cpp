#include "files/CFileUtilDates.h"
#include "platform/FileDates.h"
#include "platform/core/Status.h"

#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <limits>

namespace {

/// Sets the local time zone until the end of the scope.
class TimeZone {
public:
    explicit TimeZone(const char* zone)
    {
        if (const char* current = std::getenv("TZ"))
            before_ = current;
        ::setenv("TZ", zone, 1);
    }
    ~TimeZone()
    {
        if (before_)
            ::setenv("TZ", before_->c_str(), 1);
        else
            ::unsetenv("TZ");
    }
    TimeZone(const TimeZone&) = delete;
    TimeZone& operator=(const TimeZone&) = delete;

private:
    std::optional<std::string> before_;
};

constexpr std::int64_t kWinter = 1'705'320'000; // 2024-01-15 12:00:00 UTC
constexpr std::int64_t kSummer = 1'721'044'800; // 2024-07-15 12:00:00 UTC
constexpr double k1904 = -3'061'152'000;        // since 2001

} // namespace

TEST(Dates, TheModificationDateBothWays)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "x");
    const CFileRef file(path.c_str(), false);
    for (const double seconds : {10.0, 0.0, 725'000'000.25, -10.5, k1904}) {
        SCOPED_TRACE(seconds);
        EXPECT_EQ(CFileUtilSetUTCModDate(file, seconds), 0);
        EXPECT_EQ(CFileUtilUTCModDate(file), seconds);
        EXPECT_EQ(CFileUtilGetModificationDate(file), platform::Date{seconds});
    }
    // The command "stat" as an independent reader: ten seconds into 2001.
    ASSERT_EQ(CFileUtilSetModificationDate(file, {10}), 0);
    EXPECT_EQ(platform::fileDate(path.c_str(), platform::FileDate::modification), (platform::FileTime{978'307'210, 0}));
    for (const double none : {std::nan(""), std::numeric_limits<double>::infinity(), 1e300, -1e300})
        EXPECT_EQ(CFileUtilSetUTCModDate(file, none), kStatusParameterError);
    EXPECT_EQ(CFileUtilUTCModDate(file), 10);

    std::filesystem::create_symlink("file", folder / "link");
    EXPECT_EQ(CFileUtilUTCModDate(CFileRef((folder / "link").c_str(), false)), 10);
}

// As exact as a double allows: reading and setting a date does not change it.
TEST(Dates, WhatWasReadIsSetAgain)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "x");
    const CFileRef file(path.c_str(), false);
    using platform::FileDate;
    for (const std::uint32_t nanoseconds : {1U, 3U, 7U, 999'999'999U, 123'456'789U, 500'000'001U})
        for (const std::int64_t seconds : {978'307'200LL, 978'307'210LL, 978'307'199LL}) { // about the start of 2001
            const platform::FileTime time{seconds, nanoseconds};
            ASSERT_TRUE(platform::setFileDate(path.c_str(), FileDate::modification, time));
            EXPECT_EQ(CFileUtilSetUTCModDate(file, CFileUtilUTCModDate(file)), 0);
            EXPECT_EQ(platform::fileDate(path.c_str(), FileDate::modification), time) << seconds << "." << nanoseconds;
        }
    EXPECT_EQ(CFileUtilSetUTCModDate(file, 0.9999999999), 0); // the nearest is the next second
    EXPECT_EQ(CFileUtilUTCModDate(file), 1.0);
}

TEST(Dates, AreBumpedToNow)
{
    const TemporaryFolder folder;
    const CFileRef file(folder.write("file", "x").c_str(), false);
    ASSERT_EQ(CFileUtilSetUTCModDate(file, 10), 0);
    const std::int64_t before = platform::currentTime();
    EXPECT_EQ(CFileUtilBumpDate(file), 0);
    EXPECT_NEAR(CFileUtilUTCModDate(file) + 978'307'200, static_cast<double>(before), 60);
    EXPECT_EQ(CFileUtilBumpDate(CFileRef((folder / "missing").c_str(), false)), kStatusFileNotFound);
    EXPECT_EQ(CFileUtilBumpDate(CFileRef::None), kStatusParameterError);
}

TEST(Dates, OfOldCatalogsAreInLocalTime)
{
    const TemporaryFolder folder;
    const CFileRef file(folder.write("file", "x").c_str(), false);
    struct Case {
        const char* zone; // its offset is the same all year
        std::int64_t offset;
    };
    const Case cases[] = {
        {"EAST-1", 3600}, {"UTC", 0}, {"Asia/Kolkata", 19'800}, {"Asia/Kathmandu", 20'700}, {"WEST+9:30", -34'200},
    };
    for (const Case& each : cases) {
        SCOPED_TRACE(each.zone);
        const TimeZone zone(each.zone);
        ASSERT_EQ(CFileUtilSetUTCModDate(file, k1904), 0);
        EXPECT_EQ(CFileUtilModDate(file), static_cast<unsigned int>(each.offset));
        EXPECT_EQ(CFileUtilSetModDate(file, 0x80000000), 0);
        EXPECT_EQ(CFileUtilUTCModDate(file), k1904 + 0x80000000 - static_cast<double>(each.offset));
        EXPECT_EQ(CFileUtilModDate(file), 0x80000000);
        CFileUtilSetUTCModDate(file, k1904 + 4294967296.0 + 5); // the 33rd bit is lost
        EXPECT_EQ(CFileUtilModDate(file), static_cast<unsigned int>(each.offset + 5));
    }
}

TEST(Dates, TheLocalOffsetKnowsDaylightSaving)
{
    const TimeZone zone("Europe/Berlin");
    constexpr std::int64_t change = 1'711'846'800; // 2024-03-31 01:00:00 UTC
    EXPECT_EQ(platform::localOffsetFromUTC(change - 1), 3600);
    EXPECT_EQ(platform::localOffsetFromUTC(change), 7200);

    // The date of a file from the other half of the year is still shifted by today's offset.
    const TemporaryFolder folder;
    const CFileRef file(folder.write("file", "x").c_str(), false);
    const std::int64_t today = platform::localOffsetFromUTC(platform::currentTime());
    for (const std::int64_t time : {kWinter, kSummer}) {
        ASSERT_EQ(CFileUtilSetUTCModDate(file, static_cast<double>(time - 978'307'200)), 0);
        EXPECT_EQ(CFileUtilModDate(file), static_cast<unsigned int>(time + 2'082'844'800 + today));
    }
}
