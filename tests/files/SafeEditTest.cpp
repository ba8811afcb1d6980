// Safe edits: the old file or the new one with everything that belongs to it, and nothing left beside it.
#include "files/CSafeEdit.h"
#include "files/CTemporaryFile.h"
#include "platform/FileLock.h"
#include "platform/String.h"
#include "platform/core/Status.h"

#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <chrono>
#include <set>
#include <stdexcept>
#include <thread>

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/xattr.h>

namespace fs = std::filesystem;
using platform::OwnedDescriptor;
using Kind = FileProblem::Kind;

namespace {

const std::string kOld = "the old content", kNew = "what is new";

std::string textIn(const std::string& path)
{
    return std::string(textOf(readFile(path)));
}

std::set<std::string> namesIn(const fs::path& folder)
{
    std::set<std::string> names;
    for (const auto& entry : fs::directory_iterator(folder))
        names.insert(entry.path().filename().string());
    return names;
}

std::int32_t writeNew(const std::string& path)
{
    const OwnedDescriptor file(
        platform::systemCalls().openFile(path.c_str(), platform::OpenFor::readingAndWriting, nullptr));
    const bool good = file && platform::systemCalls().ftruncate(file.get(), 0) == 0 &&
                      platform::systemCalls().pwrite(file.get(), kNew.data(), kNew.size(), 0) == std::ssize(kNew);
    return good ? kStatusOK : kStatusIOError;
}

FileProblem edit(const std::string& path, const CSafeEdit::Change& change = writeNew, SafeEditOptions options = {})
{
    CSafeEdit edit;
    if (FileProblem problem = edit.Begin(path, options))
        return problem;
    return edit.Apply(change);
}

struct SafeEdit : testing::Test {
    TemporaryFolder folder;
    std::string path = folder.write("a", kOld);
};

} // namespace

TEST_F(SafeEdit, AFailedCallLeavesTheOldFileAndNothingBeside)
{
    int failures = 0;
    const auto failsAt = [&](Call call, int nth, bool isCopiedByHand) {
        SCOPED_TRACE(testing::Message() << static_cast<int>(call) << " " << nth << " " << isCopiedByHand);
        folder.write("a", kOld);
        fs::remove(folder / "a.bak");
        FileProblem problem;
        bool isReached = false;
        {
            FaultInjector faults;
            faults.fail(Call::shareContent, EOPNOTSUPP, 1, 1000);
            if (isCopiedByHand)
                faults.fail(Call::copyRange, ENOSYS, 1, 1000);
            faults.fail(call, ENOSPC, nth);
            problem = edit(path, writeNew, {.backup = true});
            isReached = faults.calls(call) >= nth;
        }
        const bool isThere = !problem || problem.kind == Kind::uncommitted;
        const std::set<std::string> old{"a"}, both{"a", "a.bak"};
        EXPECT_EQ(textIn(path), isThere ? kNew : kOld);
        EXPECT_EQ(namesIn(folder.path()), isThere ? both : old);
        EXPECT_EQ(problem.Status() == kStatusOK, !problem);
        failures += problem ? 1 : 0;
        return isReached;
    };
    for (const Call call : {Call::openFile, Call::openFolder, Call::createFileIn, Call::copyRange, Call::pread,
                            Call::pwrite, Call::ftruncate, Call::fsync, Call::linkFile, Call::renameIn})
        for (const bool isCopiedByHand : {false, true})
            for (int nth = 1; (call != Call::copyRange || !isCopiedByHand) && failsAt(call, nth, isCopiedByHand);)
                ++nth;
    EXPECT_GT(failures, 20);
}

TEST_F(SafeEdit, WhatTheChangeDoesAmissCostsNothing)
{
    EXPECT_EQ(edit(path, [](const std::string& copy) { return writeNew(copy), kStatusDiskFull; }).Status(),
              kStatusDiskFull);
    EXPECT_THROW((void)edit(path,
                            [](const std::string& copy) -> std::int32_t {
                                writeNew(copy);
                                throw std::runtime_error("of the caller");
                            }),
                 std::runtime_error);
    EXPECT_EQ(textIn(path), kOld);
    EXPECT_EQ(namesIn(folder.path()).size(), 1u);
}

TEST_F(SafeEdit, TheFileStaysTheFile)
{
    fs::create_symlink("a", folder / "link");
    fs::permissions(path, fs::perms(0640));
    const bool hasAttribute = ::setxattr(path.c_str(), "user.rating", "5", 1, 0) == 0;
    ASSERT_TRUE(::geteuid() != 0 || ::chown(path.c_str(), 12345, 54321) == 0);
    const timespec stamps[2] = {{1, 1}, {2, 2}};
    ASSERT_EQ(::utimensat(AT_FDCWD, path.c_str(), stamps, 0), 0);
    struct stat before = {}, after = {};
    ::stat(path.c_str(), &before);
    ASSERT_FALSE(edit(folder / "link", writeNew, {.keepTimes = true}));
    ::stat(path.c_str(), &after);
    EXPECT_EQ(textIn(path), kNew);
    EXPECT_TRUE(fs::is_symlink(folder / "link"));
    EXPECT_NE(after.st_ino, before.st_ino);
    EXPECT_EQ(after.st_mode, before.st_mode);
    EXPECT_EQ(std::pair(after.st_uid, after.st_gid), std::pair(before.st_uid, before.st_gid));
    EXPECT_EQ(std::pair(after.st_mtim.tv_sec, after.st_mtim.tv_nsec), std::pair(stamps[1].tv_sec, stamps[1].tv_nsec));
    char rating = 0;
    EXPECT_EQ(::getxattr(path.c_str(), "user.rating", &rating, 1) == 1 && rating == '5', hasAttribute);
}

TEST_F(SafeEdit, AnOwnerThatCannotBeKeptIsTold)
{
    const OwnedDescriptor from(::open(path.c_str(), O_RDWR)),
        to(::open((folder / "b").c_str(), O_RDWR | O_CREAT, 0600));
    platform::FileAttributes attributes;
    ASSERT_TRUE(platform::fileAttributes(from.get(), attributes));
    ++attributes.owner;
    FaultInjector faults;
    faults.fail(Call::setOwner, EPERM);
    const FileProblem problem = CopyFileAttributes(from.get(), attributes, to.get());
    EXPECT_EQ(problem.kind, Kind::owner);
    EXPECT_EQ(problem.Status(), PosixErrorToOSErr(EPERM));
}

TEST_F(SafeEdit, HolesAndDataAreCopied)
{
    const std::string sound(100'000, 'x');
    for (const int error : {0, ENOSYS}) {
        const OwnedDescriptor from(::open((folder / "from").c_str(), O_RDWR | O_CREAT | O_TRUNC, 0600));
        ASSERT_EQ(::pwrite(from.get(), sound.data(), sound.size(), 1 << 20), std::ssize(sound));
        ASSERT_EQ(::ftruncate(from.get(), 5 << 20), 0);
        const OwnedDescriptor to(::open((folder / "to").c_str(), O_RDWR | O_CREAT | O_TRUNC, 0600));
        FaultInjector faults;
        faults.fail(Call::shareContent, EOPNOTSUPP);
        if (error != 0)
            faults.fail(Call::copyRange, error, 1, 1000);
        faults.limitTransfers(999);
        std::int64_t done = 0, all = 0;
        EXPECT_FALSE(CopyFileContent(from.get(), to.get(), [&](std::int64_t now, std::int64_t total) {
            EXPECT_GE(now, done);
            done = now, all = total;
        }));
        EXPECT_EQ(std::pair(done, all), std::pair(std::int64_t{5} << 20, std::int64_t{5} << 20));
        EXPECT_TRUE(textIn(folder / "to") == textIn(folder / "from"));
    }
}

TEST_F(SafeEdit, OtherNamesKeepNoOldContent)
{
    fs::create_hard_link(path, folder / "b");
    const FileProblem problem = edit(path);
    EXPECT_EQ(problem.kind, Kind::hardLinks);
    EXPECT_EQ(problem.count, 2u);
    EXPECT_EQ(textIn(path), kOld);
    EXPECT_FALSE(edit(path, writeNew, {.inPlace = true}));
    EXPECT_EQ(textIn(folder / "b"), kNew);
}

TEST_F(SafeEdit, BackupsAreNeverOverwritten)
{
    for (const bool inPlace : {false, true}) {
        CSafeEdit edit;
        ASSERT_FALSE(edit.Begin(path, {.inPlace = inPlace, .backup = true}));
        ASSERT_FALSE(edit.Apply(writeNew));
        EXPECT_EQ(edit.Backup(), fs::canonical(path).string() + (inPlace ? ".bak.1" : ".bak"));
    }
    EXPECT_EQ(textIn(path + ".bak"), kOld);
    EXPECT_EQ(textIn(path + ".bak.1"), kNew);
    // The state after an edit that was killed between its backup and its end.
    fs::create_hard_link(path, path + ".bak.2");
    EXPECT_EQ(edit(path, writeNew, {.inPlace = true}).kind, Kind::sameAsBackup);
    EXPECT_FALSE(edit(path, [](const std::string&) { return kStatusOK; }, {.backup = true}));
    EXPECT_EQ(namesIn(folder.path()), (std::set<std::string>{"a", "a.bak", "a.bak.1", "a.bak.2"}));
    EXPECT_FALSE(fs::equivalent(path, path + ".bak.2"));
}

TEST_F(SafeEdit, WhatOthersDoMeanwhileStands)
{
    const std::string none = "no file";
    const struct {
        std::string after;
        std::function<void()> act;
    } cases[] = {
        {"THE OLD CONTENT", [&] { folder.write("a", "THE OLD CONTENT"); }}, // as long as before
        {"another's", [&] { fs::rename(folder.write("new", "another's"), path); }},
        {none, [&] { fs::remove(path); }},
    };
    for (const auto& each : cases) {
        std::this_thread::sleep_for(std::chrono::milliseconds(20)); // clocks of file systems are coarse
        const auto change = [&](const std::string& copy) { return each.act(), writeNew(copy); };
        EXPECT_EQ(edit(path, change).kind, Kind::changed);
        EXPECT_EQ(fs::exists(path) ? textIn(path) : none, each.after);
    }
    EXPECT_TRUE(namesIn(folder.path()).empty());
}

TEST_F(SafeEdit, ANameThatIsGivenAwayLeadsNoEditAstray)
{
    const std::string victim = folder.write("victim", kOld), temporary = folder / ".a.ktfiles-0";
    const auto swap = [&](const std::string& copy) {
        fs::rename(temporary, folder / "moved");
        fs::create_symlink("victim", temporary);
        return writeNew(copy);
    };
    EXPECT_EQ(edit(path, swap).kind, Kind::givenAway);
    EXPECT_EQ(textIn(victim) + textIn(path), kOld + kOld);
    EXPECT_EQ(textIn(folder / "moved"), kNew);
    EXPECT_TRUE(fs::is_symlink(temporary)); // another's
}

TEST_F(SafeEdit, AFolderThatIsGivenAwayLeadsNoEditAstray)
{
    fs::create_directory(folder / "one");
    folder.write("one/a", kOld);
    const auto swap = [&](const std::string& copy) {
        fs::rename(folder / "one", folder / "two");
        fs::create_directory(folder / "one");
        folder.write("one/a", "victim");
        return writeNew(copy);
    };
    EXPECT_FALSE(edit(folder / "one/a", swap));
    EXPECT_EQ(textIn(folder / "one/a"), "victim");
    EXPECT_EQ(textIn(folder / "two/a"), kNew);
}

TEST_F(SafeEdit, EditsWaitForEachOther)
{
    CSafeEdit first;
    ASSERT_FALSE(first.Begin(path));
    const FileProblem problem =
        edit(path, writeNew, {.waitForLock = [](int, const std::string&) { return kStatusFileBusy; }});
    EXPECT_EQ(problem.kind, Kind::refused);
    EXPECT_EQ(problem.Status(), kStatusFileBusy);
    // The second edit changes the file that the first one has put in place.
    const auto wait = [&](int, const std::string&) {
        EXPECT_FALSE(first.Apply([&](const std::string& copy) { return writeNew(copy); }));
        return kStatusOK;
    };
    std::string seen;
    EXPECT_FALSE(
        edit(path, [&](const std::string& copy) { return seen = textIn(copy), kStatusOK; }, {.waitForLock = wait}));
    EXPECT_EQ(seen, kNew);
}

TEST_F(SafeEdit, OnlyRegularFilesThatAreThere)
{
    ASSERT_EQ(::mkfifo((folder / "fifo").c_str(), 0600), 0);
    EXPECT_EQ(edit(folder / "fifo").systemError, ENXIO);
    EXPECT_EQ(edit(folder.path()).systemError, EISDIR);
    EXPECT_EQ(edit(folder / "missing").Status(), kStatusFileNotFound);
}

TEST(TemporaryFile, WhatAKilledProcessLeftGoesAndWhatIsAliveStays)
{
    const TemporaryFolder folder;
    folder.write(".a.ktfiles-0", "left");
    folder.write("victim", "not ours");
    fs::create_symlink("victim", folder / ".a.ktfiles-2");
    const OwnedDescriptor alive(::open(folder.write(".a.ktfiles-1", "alive").c_str(), O_RDWR));
    ASSERT_EQ(platform::tryToLockFile(alive.get()), platform::FileLockResult::locked);
    CTemporaryFile one, two;
    EXPECT_FALSE(one.Create(folder / "a"));
    EXPECT_FALSE(two.Create(folder / "a"));
    EXPECT_EQ(namesIn(folder.path()),
              (std::set<std::string>{".a.ktfiles-0", ".a.ktfiles-1", ".a.ktfiles-2", ".a.ktfiles-3", "victim"}));
    EXPECT_EQ(textIn(folder / ".a.ktfiles-1"), "alive");
}

TEST(TemporaryFile, TakesAFreeNameOnlyOnce)
{
    const TemporaryFolder folder;
    CTemporaryFile made;
    ASSERT_FALSE(made.Create(folder / "a"));
    ASSERT_EQ(writeNew(made.Path()), kStatusOK);
    folder.write("a", kOld);
    const FileProblem problem = made.Publish(folder / "a");
    EXPECT_EQ(std::pair(problem.kind, problem.systemError), std::pair(Kind::system, EEXIST));
    EXPECT_EQ(problem.Status(), kStatusDuplicateName);
    EXPECT_FALSE(made.Publish(folder / "b"));
    EXPECT_FALSE(made.CommitFolder());
    EXPECT_EQ(textIn(folder / "a") + textIn(folder / "b"), kOld + kNew);
    EXPECT_EQ(namesIn(folder.path()).size(), 2u);
}

TEST(TemporaryFile, ASignalHandlerRemovesThem)
{
    const TemporaryFolder folder;
    CTemporaryFile files[20]; // more than the handler knows
    for (CTemporaryFile& file : files)
        ASSERT_FALSE(file.Create(folder / std::to_string(&file - files)));
    CTemporaryFile::RemoveAllFromSignalHandler();
    EXPECT_EQ(namesIn(folder.path()).size(), 4u);
}

TEST(TemporaryFile, LongNamesAreCutAtACharacter)
{
    const TemporaryFolder folder;
    std::string umlauts;
    while (umlauts.size() < 254)
        umlauts += "\u00f6";
    for (const std::string& name : {std::string(255, 'x'), umlauts}) {
        CTemporaryFile file;
        ASSERT_FALSE(file.Create(folder / name));
        EXPECT_FALSE(platform::String::fromFileSystemRepresentation(namesIn(folder.path()).begin()->c_str()).isNull());
        EXPECT_FALSE(file.Publish(folder / name));
        fs::remove(folder / name);
    }
}
