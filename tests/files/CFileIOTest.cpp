#include "files/CFileIO.h"

#include "files/CFileUtil.h"
#include "platform/Bookmark.h"
#include "platform/Log.h"
#include "platform/core/CRC32.h"
#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <random>
#include <thread>

namespace fs = std::filesystem;

namespace {

constexpr long long kHuge = std::numeric_limits<long long>::max();
constexpr std::size_t kMiB = 1048576;

/// Bytes in which all windows differ.
Bytes pattern(std::size_t size)
{
    std::minstd_rand random(1);
    Bytes bytes(size);
    for (std::byte& byte : bytes)
        byte = static_cast<std::byte>(random() >> 8);
    return bytes;
}

CFileRef fileRef(const std::string& path)
{
    return CFileRef(path.c_str(), false);
}

std::string loggedLine;

class CFileIOTest : public testing::Test {
protected:
    CFileIOTest() : handler_(platform::setLogHandler([](const char* line) { loggedLine = line; }))
    {
        loggedLine.clear();
    }
    ~CFileIOTest() override { platform::setLogHandler(handler_); }

    CFileRef fileOf(const Bytes& bytes) const { return fileRef(folder.write("file", bytes)); }

    const TemporaryFolder folder;

private:
    platform::LogHandler handler_;
};

} // namespace

TEST_F(CFileIOTest, OpenRefusesWhatIsNoFile)
{
    fs::create_directory(folder / "folder");
    ASSERT_EQ(mkfifo((folder / "fifo").c_str(), 0600), 0);
    fs::create_symlink("fifo", folder / "link to fifo");
    fs::create_symlink("nowhere", folder / "dangling");
    const struct {
        std::string path;
        std::int32_t forReading, forWriting;
    } cases[] = {
        {folder / "folder", kStatusParameterError, kStatusParameterError},
        {folder / "fifo", kStatusNotAFile, kStatusNotAFile},
        {folder / "link to fifo", kStatusNotAFile, kStatusNotAFile},
        {"/dev/null", kStatusNotAFile, kStatusNotAFile},
        {folder / "none/audio", kStatusFileNotFound, kStatusFileNotFound},
        {folder / "dangling", kStatusFileNotFound, kStatusDuplicateName},
        {folder / std::string(300, 'n'), kStatusFileNotFound, kStatusBadName},
        {"", kStatusFileNotFound, kStatusParameterError},
    };
    const int before = open("/dev/null", O_RDONLY);
    for (const auto& c : cases) {
        for (const bool write : {false, true}) {
            SCOPED_TRACE(c.path + (write ? " for writing" : " for reading"));
            CFileIO io(fileOf(Bytes()), 0); // must not stay open either
            EXPECT_EQ(io.Open(fileRef(c.path), write ? 1 : 0), write ? c.forWriting : c.forReading);
            EXPECT_FALSE(io.IsValid() || io.IsOpen() || io.Mode() != 0);
        }
    }
    const int after = open("/dev/null", O_RDONLY);
    EXPECT_EQ(after, before + 1); // no refusal kept a descriptor
    close(before);
    close(after);
}

// Every path through the cache delivers the same as a plain read, including status and count.
TEST_F(CFileIOTest, CachedReadsEqualPlainReads)
{
    const CFileRef file = fileOf(pattern(1000));
    std::minstd_rand random(7);
    for (const long cache : {0L, 1L, 7L, 64L, 999L, 1000L, 4096L}) {
        for (const std::size_t limit : {std::size_t{4096}, std::size_t{13}}) {
            FaultInjector faults;
            faults.limitTransfers(limit);
            CFileIO plain(file, 0), cached(file, 0);
            ASSERT_EQ(cached.SetCache(cache), kStatusOK);
            for (int i = 0; i < 300; ++i) {
                const auto position = static_cast<long long>(random() % 1100);
                const auto count = static_cast<long>(random() % (i % 2 == 0 ? 40 : 1100));
                Bytes expected(1100), actual(1100);
                long expectedCount = -1, actualCount = -1;
                const auto status = plain.Read(expected.data(), position, count, &expectedCount);
                EXPECT_EQ(cached.Read(actual.data(), position, count, &actualCount), status);
                EXPECT_EQ(actualCount, expectedCount);
                ASSERT_EQ(actual, expected) << "cache " << cache << ", " << count << " at " << position;
            }
        }
    }
}

TEST_F(CFileIOTest, ReadFailuresAreLoggedAndTellWhatWasDelivered)
{
    CFileIO io(fileOf(pattern(100)), 0);
    char buffer[200];
    long actual = -1;
    FaultInjector faults;
    faults.limitTransfers(30);
    faults.fail(Call::pread, EINTR, 2, 3);
    EXPECT_EQ(io.Read(buffer, 0, 100, &actual), kStatusOK);
    EXPECT_EQ(loggedLine, "");
    faults.fail(Call::pread, EIO, 3);
    EXPECT_EQ(io.Read(buffer, 0, 100, &actual), kStatusIOError);
    EXPECT_EQ(actual, 60);
    EXPECT_EQ(loggedLine, "Encountered read failure 5 Input/output error");
    EXPECT_EQ(io.Read(buffer, -1, 20, &actual), kStatusParameterError);
    EXPECT_EQ(io.Read(buffer, 0, -1, &actual), kStatusParameterError);
    EXPECT_EQ(io.Read(buffer, kHuge, 3, &actual), kStatusParameterError);
    EXPECT_EQ(actual, 0);
    // Damage after the requested bytes must not fail the request.
    io.SetCache(100);
    faults.fail(Call::pread, EIO, 2);
    EXPECT_EQ(io.Read(buffer, 0, 40, &actual), kStatusOK);
    EXPECT_EQ(actual, 40);
}

TEST_F(CFileIOTest, WriteCacheHoldsBytesUntilFlushed)
{
    const std::string file = folder / "file";
    const struct {
        void (*act)(CFileIO& io);
        const char* written;
    } cases[] = {
        {[](CFileIO& io) { EXPECT_EQ(io.FlushWCache(), kStatusOK); }, "abcdef"},
        {[](CFileIO& io) { EXPECT_EQ(io.Close(), kStatusOK); }, "abcdef"},
        {[](CFileIO& io) { EXPECT_EQ(io.Open(CFileRef(io), 0), kStatusOK); }, "abcdef"},
        {[](CFileIO& io) { EXPECT_EQ(io.Write("X", 2, 1), kStatusOK); }, "abXdef"},
        {[](CFileIO& io) { EXPECT_EQ(io.SetWCache(0), kStatusOK); }, "abcdef"},
        {[](CFileIO& io) { EXPECT_EQ(io.SetWCache(new char[9], 9), kStatusOK); }, "abcdef"},
        {[](CFileIO& io) { EXPECT_EQ(io.Write("0123456789", 10), kStatusOK); }, ""}, // fits exactly
        {[](CFileIO& io) { EXPECT_EQ(io.Write("0123456789-", 11), kStatusOK); }, "abcdef0123456789-"},
        {[](CFileIO& io) { io.Flush(); }, ""}, // commits what is in the file
        {[](CFileIO& io) { io.DeAllocWCache(), io.Close(); }, ""},
        {[](CFileIO& io) { io.Init(); }, ""},
    };
    for (const auto& c : cases) {
        fs::remove(file);
        CFileIO io(fileRef(file), 1);
        io.SetWCache(16);
        EXPECT_EQ(io.Write("abcdef", 6), kStatusOK);
        EXPECT_EQ(fs::file_size(file), 0u);
        c.act(io);
        EXPECT_EQ(textOf(readFile(file)), c.written) << "case " << &c - cases;
    }
}

TEST_F(CFileIOTest, WritingAndCuttingMoveMarkAndReadCache)
{
    CFileIO io(fileOf(Bytes(100)), 1);
    io.SetMark(80);
    io.SetCache(50);
    char byte = 0;
    EXPECT_EQ(io.Read(&byte, 10, 1, nullptr), kStatusOK);
    EXPECT_EQ(io.Write("a", 10, 1), kStatusOK);
    EXPECT_EQ(io.Read(&byte, 10, 1, nullptr), kStatusOK);
    EXPECT_EQ(byte, 'a');
    EXPECT_EQ(io.SetEOF(90), kStatusOK);
    EXPECT_EQ(io.GetMark(), 80);
    EXPECT_EQ(io.SetEOF(10), kStatusOK);
    EXPECT_EQ(io.GetMark(), 10);
    EXPECT_EQ(io.Read(&byte, 10, 1, nullptr), kStatusEndOfFile);
}

TEST_F(CFileIOTest, WriteFailuresLoseNothingSilently)
{
    const CFileRef file = fileOf(Bytes());
    FaultInjector faults;
    CFileIO io(file, 1);
    faults.limitTransfers(3);
    faults.fail(Call::pwrite, EINTR, 1, 2);
    EXPECT_EQ(io.Write("abcdefgh", 0, 8), kStatusOK);
    faults.fail(Call::pwrite, 0, 2);
    EXPECT_EQ(io.Write("ABCDEFGH", 8), kStatusDiskFull);
    EXPECT_EQ(io.GetMark(), 0);

    io.SetWCache(16);
    EXPECT_EQ(io.Write("ABCDEFGH", 8), kStatusOK);
    faults.fail(Call::pwrite, ENOSPC, 2);
    EXPECT_EQ(io.SetWCache(32), kStatusDiskFull); // changes nothing: the bytes stay pending
    EXPECT_EQ(io.FlushWCache(), kStatusOK);
    EXPECT_EQ(io.GetMark(), 8);
    EXPECT_EQ(textOf(readFile(file.GetPath())), "ABCDEFGH");

    EXPECT_EQ(io.Write("more", 4), kStatusOK);
    faults.fail(Call::pwrite, EDQUOT);
    faults.fail(Call::close, EIO);
    EXPECT_EQ(io.Close(), kStatusQuotaExceeded); // the first error wins
    EXPECT_FALSE(io.IsOpen());
    ASSERT_EQ(io.Open(file, 1), kStatusOK);
    faults.fail(Call::fsync, EIO);
    EXPECT_EQ(io.Flush(), kStatusIOError);
    faults.fail(Call::ftruncate, EFBIG);
    EXPECT_EQ(io.SetEOF(99), kStatusFileTooBig);
    faults.fail(Call::preallocate, ENOSPC);
    EXPECT_EQ(io.Allocate(99, true), kStatusOK); // only a request
    EXPECT_EQ(io.GetEOF(), 99);
    faults.fail(Call::close, EIO);
    EXPECT_EQ(io.Close(), kStatusIOError);
    EXPECT_EQ(io.Close(), kStatusOK);
}

TEST_F(CFileIOTest, BlockMoveKeepsTheTail)
{
    const struct {
        std::size_t size, from, to;
    } cases[] = {{1000, 100, 50},         {1000, 50, 100},        {1000, 1000, 1100},  {1000, 1000, 0},
                 {3 * kMiB + 5, 10, 17},  {3 * kMiB + 5, 17, 10}, {2 * kMiB, 0, kMiB}, {2 * kMiB + 1, kMiB, 0},
                 {kMiB + 1, 1, 3 * kMiB}, {1000, 500, 500}};
    for (const unsigned int mode : {0x0001u, 0x8001u}) {
        for (const auto& c : cases) {
            SCOPED_TRACE(testing::Message() << c.size << ": " << c.from << " to " << c.to << ", mode " << mode);
            Bytes expected = pattern(c.size);
            CFileIO io(fileOf(Bytes()), mode);
            ASSERT_EQ(io.Write(expected.data(), 0, static_cast<long>(c.size)), kStatusOK);
            ASSERT_EQ(io.BlockMove(static_cast<long long>(c.from), static_cast<long long>(c.to)), kStatusOK);
            Bytes found(c.size + c.to - c.from);
            ASSERT_EQ(io.GetEOF(), static_cast<long long>(found.size()));
            ASSERT_EQ(io.Read(found.data(), 0, static_cast<long>(found.size()), nullptr), kStatusOK);
            // Old bytes between the two positions may become anything.
            const auto kept = static_cast<std::ptrdiff_t>(std::min(c.from, c.to));
            EXPECT_TRUE(std::equal(found.begin(), found.begin() + kept, expected.begin()));
            const auto moved = static_cast<std::ptrdiff_t>(c.size - c.from);
            EXPECT_TRUE(std::equal(found.end() - moved, found.end(), expected.end() - moved));
        }
    }
}

TEST_F(CFileIOTest, BlockMoveStopsAtTheFirstFailure)
{
    const Bytes content = pattern(3 * kMiB);
    const CFileRef file = fileOf(content);
    CFileIO io(file, 0);
    EXPECT_EQ(io.BlockMove(0, 10), kStatusNotOpen);
    ASSERT_EQ(io.Open(file, 1), kStatusOK);
    EXPECT_EQ(io.BlockMove(-1, 10), kStatusParameterError);
    EXPECT_EQ(io.BlockMove(3 * kMiB + 1, 3 * kMiB), kStatusParameterError);
    EXPECT_EQ(io.BlockMove(0, kHuge), kStatusFileTooBig);
    FaultInjector faults;
    faults.fail(Call::preallocate, ENOSPC);
    EXPECT_EQ(io.BlockMove(0, 10), kStatusDiskFull);
    EXPECT_EQ(readFile(file.GetPath()), content); // a full disk is found before anything is moved
    faults.fail(Call::preallocate, EOPNOTSUPP);
    faults.fail(Call::pwrite, EIO, 2);
    EXPECT_EQ(io.BlockMove(0, 10), kStatusIOError);
    EXPECT_EQ(faults.calls(Call::pwrite), 2);
    faults.fail(Call::pread, EIO);
    EXPECT_EQ(io.BlockMove(10, 0), kStatusIOError);
    EXPECT_EQ(io.GetEOF(), static_cast<long long>(3 * kMiB + 10)); // not cut
}

TEST_F(CFileIOTest, WhatIsMissingOrNegativeMovesNothing)
{
    CFileIO io(fileOf(pattern(100)), 1);
    io.SetMark(40);
    void* data = nullptr;
    long size = 0;
    char byte = 0;
    EXPECT_EQ(io.Read(static_cast<void**>(nullptr), &size), kStatusParameterError);
    EXPECT_EQ(io.Read(&data, nullptr), kStatusParameterError);
    EXPECT_EQ(io.Read(&byte, static_cast<long*>(nullptr)), kStatusParameterError);
    EXPECT_EQ(io.Read(&byte, -1L), kStatusParameterError);
    for (const int cache : {0, 64}) {
        io.SetWCache(cache);
        EXPECT_EQ(io.Write(nullptr, 1), kStatusParameterError);
        EXPECT_EQ(io.Write(&byte, -1), kStatusParameterError);
        EXPECT_EQ(io.Write(nullptr, 0, 1), kStatusParameterError);
        EXPECT_EQ(io.Write(nullptr, 0), kStatusOK);
        EXPECT_EQ(io.GetMark(), 40);
    }
    EXPECT_EQ(io.UnRead(30), kStatusOK);
    EXPECT_EQ(io.GetMark(), 10);
    EXPECT_EQ(io.UnRead(11), kStatusBeforeStart);
    EXPECT_EQ(io.GetMark(), 0);
    EXPECT_EQ(readFile(io.GetPath()), pattern(100));
    EXPECT_EQ(io.Read(&data, &size), kStatusOK);
    EXPECT_EQ(size, 100);
    EXPECT_EQ(io.GetMark(), 100);
    std::free(data);
}

TEST_F(CFileIOTest, CRCIsThatOfAllBytesFromTheMark)
{
    for (const std::size_t size : {0U, 1U, 10240U, 30000U}) {
        const Bytes content = pattern(size);
        const auto length = static_cast<long long>(size);
        CFileIO io(fileOf(content), 0);
        EXPECT_EQ(io.CRC(), ECCRC32(0, content.data(), size)) << size;
        EXPECT_EQ(io.GetMark(), length);
        EXPECT_EQ(io.CRC(), size == 0 ? 0 : 0xFFFFFFFF); // the mark is at the end
    }
}

TEST_F(CFileIOTest, ARequestBeyondTheCacheLeavesItAsItIs)
{
    const Bytes content = pattern(1000);
    CFileIO io(fileOf(content), 0);
    io.SetCache(100);
    Bytes buffer(1000);
    ASSERT_EQ(io.Read(buffer.data(), 50, 10, nullptr), kStatusOK);
    FaultInjector faults;
    ASSERT_EQ(io.Read(buffer.data(), 500, 400, nullptr), kStatusOK);
    EXPECT_EQ(faults.calls(Call::pread), 1);
    ASSERT_EQ(io.Read(buffer.data(), 149, 1, nullptr), kStatusOK);
    EXPECT_EQ(faults.calls(Call::pread), 1);
    EXPECT_EQ(buffer[0], content[149]);
}

TEST_F(CFileIOTest, MemoryFilesGrowByTheirMarkAndTakeABlockForContent)
{
    CFileIO io(CFileRef::None, 0x8001);
    // Growing sets the length, which moves a mark beyond it back.
    io.SetMark(100);
    EXPECT_EQ(io.Write("x", 10, 1), kStatusOK);
    EXPECT_EQ(io.GetEOF(), 11);
    EXPECT_EQ(io.GetMark(), 11);
    EXPECT_EQ(io.Write(nullptr, 20, 0), kStatusOK); // nothing, as far as there
    EXPECT_EQ(io.GetEOF(), 20);
    io.SetMark(30);
    EXPECT_EQ(io.Write("y", 1), kStatusOK);
    EXPECT_EQ(io.GetEOF(), 31);
    EXPECT_EQ(io.GetMark(), 31);

    EXPECT_EQ(io.SetCache(5), kStatusOK);
    EXPECT_EQ(io.GetEOF(), 5);
    char zeros[5] = {1, 1, 1, 1, 1};
    EXPECT_EQ(io.Read(zeros, 0, 5, nullptr), kStatusOK);
    EXPECT_EQ(std::count(zeros, zeros + 5, 0), 5);
    EXPECT_EQ(io.Read(zeros, 0, 6, nullptr), kStatusEndOfFile);
    EXPECT_EQ(io.SetCache(-1), kStatusParameterError);
    EXPECT_EQ(io.GetEOF(), 5);
}

TEST_F(CFileIOTest, TheSystemIsToldOnceThatALargeFileIsNotWantedAgain)
{
    static int hints;
    SystemCallGuard guard;
    platform::systemCalls().adviseNoReuse = [](int) { return ++hints, 0; };
    const CFileRef file = fileOf(Bytes());
    const struct {
        void (*grow)(CFileIO& io);
        int hints;
    } cases[] = {
        {[](CFileIO& io) { io.Write("x", kMiB - 2, 1); }, 0},
        {[](CFileIO& io) { io.Write("x", kMiB - 1, 1), io.Write("x", kHuge - 2, 1); }, 1},
        {[](CFileIO& io) { io.SetEOF(kMiB - 1); }, 0},
        {[](CFileIO& io) { io.SetEOF(kMiB), io.SetEOF(2 * kMiB); }, 1},
        {[](CFileIO& io) { io.SetEOF(kMiB), io.Open(CFileRef(io), 1); }, 2},
    };
    for (const auto& c : cases) {
        fs::resize_file(file.GetPath(), 0);
        CFileIO io(file, 1);
        hints = 0;
        c.grow(io);
        EXPECT_EQ(hints, c.hints) << "case " << &c - cases;
    }
}

TEST_F(CFileIOTest, AllocatingKeepsNoSpaceBehindTheEnd)
{
    CFileIO io(fileOf(pattern(kMiB)), 1);
    ASSERT_EQ(io.Allocate(3 * kMiB, true), kStatusOK);
    EXPECT_EQ(io.GetEOF(), static_cast<long long>(3 * kMiB));
    struct stat status = {};
    ASSERT_EQ(stat(io.GetPath(), &status), 0);
    EXPECT_LE(static_cast<std::size_t>(status.st_blocks) * 512, 3 * kMiB + 65536);
}

// Whether opened at once or step by step, the base holds the path of the file itself.
TEST_F(CFileIOTest, DotsInAPathAreResolved)
{
    fs::create_directories(folder / "sub/.hidden");
    const std::string target = folder.write("file", "x");
    const std::string hidden = folder.write("sub/.hidden/..x", "x");
    const std::pair<std::string, std::string> cases[] = {
        {folder / "sub/../file", target},
        {folder / "./file", target},
        {folder / "sub/.hidden/../../file", target},
        {folder / "sub/.hidden/..x", hidden},
    };
    for (const auto& [path, expected] : cases) {
        CFileIO io(fileRef(path), 0);
        EXPECT_STREQ(io.GetPath(), expected.c_str()) << path;
    }
}

// File servers hold leases on files in use. Opening such a file waits until the lease is returned.
TEST_F(CFileIOTest, AFileUnderALeaseIsWaitedFor)
{
    const CFileRef file = fileOf(pattern(10));
    fs::create_symlink("file", folder / "link");
    const auto before = std::signal(SIGIO, SIG_IGN); // what the holder is sent
    for (const CFileRef& ref : {file, fileRef(folder / "link")})
        for (const unsigned int mode : {0U, 1U}) {
            const int holder = open(file.GetPath(), O_RDONLY | O_CLOEXEC);
            if (fcntl(holder, F_SETLEASE, mode == 0 ? F_WRLCK : F_RDLCK) != 0) {
                close(holder);
                std::signal(SIGIO, before);
                GTEST_SKIP() << "no leases here";
            }
            std::atomic<bool> isOpen = false;
            std::int32_t status = 1;
            std::thread opener([&] {
                CFileIO io;
                status = io.Open(ref, mode);
                isOpen = true;
            });
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
            EXPECT_FALSE(isOpen);
            EXPECT_EQ(fcntl(holder, F_SETLEASE, F_UNLCK), 0);
            opener.join();
            EXPECT_EQ(status, kStatusOK) << "mode " << mode;
            close(holder);
        }
    std::signal(SIGIO, before);
}

// Opening a FIFO releases a waiting writer, which the following close would kill.
TEST_F(CFileIOTest, TheWriterOfAFIFOIsLeftWaiting)
{
    const std::string path = folder / "fifo.mp3";
    ASSERT_EQ(mkfifo(path.c_str(), 0600), 0);
    std::atomic<bool> isOpen = false;
    std::atomic<pid_t> task = 0;
    std::thread writer([&] {
        task = gettid();
        close(open(path.c_str(), O_WRONLY | O_CLOEXEC));
        isOpen = true;
    });
    const auto waits = [&task] { // state "asleep" after the name
        std::string stat;
        std::getline(std::ifstream("/proc/self/task/" + std::to_string(task) + "/stat"), stat);
        return stat.find(") S ") != stat.npos;
    };
    while (task == 0 || !waits())
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    CFileIO io;
    EXPECT_EQ(io.Open(fileRef(path), 0), kStatusNotAFile);
    std::this_thread::sleep_for(std::chrono::milliseconds(100));
    EXPECT_FALSE(isOpen);
    close(open(path.c_str(), O_RDWR | O_CLOEXEC));
    writer.join();
}
