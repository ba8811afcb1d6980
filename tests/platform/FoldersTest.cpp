#include "platform/Folders.h"
#include "platform/SmallFile.h"
#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cerrno>

namespace fs = std::filesystem;
using namespace platform;

namespace {

TEST(Folders, RemovalStaysInsideAndTellsOfFailure)
{
    const TemporaryFolder folder;
    fs::create_directories(folder / "tree/a/b");
    fs::create_directory(folder / "outside");
    folder.write("outside/kept", "");
    folder.write("tree/a/b/file", "");
    fs::create_directory_symlink("../../outside", folder / "tree/a/link");
    {
        FaultInjector faults;
        faults.fail(Call::removeFile, EACCES, 2);
        EXPECT_FALSE(removeTree(folder / "tree"));
        EXPECT_EQ(errno, EACCES);
    }
    EXPECT_TRUE(removeTree(folder / "tree"));
    EXPECT_FALSE(fs::exists(folder / "tree"));
    EXPECT_TRUE(fs::exists(folder / "outside/kept"));
    EXPECT_FALSE(removeTree(folder / "tree"));
    EXPECT_EQ(errno, ENOENT);
}

TEST(SmallFile, AFullDiskIsMetBeforeAByteChanges)
{
    const TemporaryFolder folder;
    const std::string file = folder.write("file", "the old content");
    for (const Call call : {Call::preallocate, Call::openFile, Call::pwrite, Call::ftruncate, Call::close}) {
        FaultInjector faults;
        faults.fail(call, ENOSPC);
        EXPECT_FALSE(writeSmallFile(file.c_str(), bytesOf("new")));
        EXPECT_EQ(errno, ENOSPC);
        if (call == Call::preallocate || call == Call::openFile || call == Call::pwrite) {
            EXPECT_EQ(textOf(readFile(file)), "the old content");
        }
    }
    FaultInjector faults;
    faults.limitTransfers(2);
    EXPECT_TRUE(writeSmallFile(file.c_str(), bytesOf("new")));
    EXPECT_EQ(textOf(readFile(file)), "new");
    EXPECT_EQ(textOf(*readSmallFile(file.c_str(), 3)), "new");
    EXPECT_EQ(readSmallFile(file.c_str(), 2), std::nullopt);
}

TEST(SystemCalls, NamesAreNeverReplaced)
{
    const TemporaryFolder folder;
    const std::string a = folder.write("a", "1"), b = folder.write("b", "2"), c = folder / "c";
    const SystemCalls& calls = systemCalls();
    EXPECT_EQ(calls.renameWithoutReplacing(a.c_str(), b.c_str()), -1);
    EXPECT_EQ(errno, EEXIST);
    EXPECT_EQ(calls.renameWithoutReplacing(c.c_str(), (folder / "d").c_str()), -1);
    EXPECT_EQ(errno, ENOENT);
    EXPECT_EQ(calls.exchangeNames(a.c_str(), c.c_str()), -1);
    EXPECT_EQ(errno, ENOENT);
    ASSERT_EQ(calls.exchangeNames(a.c_str(), b.c_str()), 0);
    ASSERT_EQ(calls.renameWithoutReplacing(a.c_str(), c.c_str()), 0);
    EXPECT_EQ(readFile(c), Bytes{std::byte{0x32}});
    EXPECT_EQ(readFile(b), Bytes{std::byte{0x31}});
}

} // namespace
