// The exchange of an alternative's data with a backup's, interrupted at every call that it makes.
#include "PackageOnDisk.h"
#include "support/FaultInjection.h"
#include "support/QuietLog.h"

#include <map>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace {

using namespace platform;
using Info = ProjectInformation;
using Tree = std::map<std::string, std::string>; // path -> content

const char* const kAlternative = "Alternatives/000";
const char* const kFirst = "Alternatives/000/Project File Backups/00";
const char* const kSecond = "Alternatives/000/Project File Backups/01";

Tree contentOf(const std::string& folder)
{
    Tree tree;
    for (const auto& entry : fs::recursive_directory_iterator(folder))
        if (entry.is_regular_file())
            tree[fs::relative(entry.path(), folder)] = textOf(readFile(entry.path()));
    return tree;
}

/// An alternative with all exchanged items, a backup with fewer, and another backup.
class Exchange {
public:
    Exchange()
    {
        for (const char* item :
             {"ProjectData", "MetaData.plist", "MetaData.bak", "ARA Files/one", "Autosave/data", "WindowImage.jpg"})
            package_.write(std::string(kAlternative) + '/' + item, std::string("mine: ") + item);
        for (const char* item : {"ProjectData", "MetaData.plist", "ARA Files/two"})
            package_.write(std::string(kFirst) + '/' + item, std::string("first: ") + item);
        package_.write(std::string(kSecond) + "/ProjectData", std::string_view("second: ProjectData"));
        before_ = now();
        EXPECT_TRUE(exchange());
        after_ = now();
        EXPECT_TRUE(exchange());
        EXPECT_EQ(now(), before_); // twice is as if never
        EXPECT_NE(before_, after_);
    }

    bool exchange(const char* backup = kFirst, Error* error = nullptr) const
    {
        return Info::exchangeDataOfProjectAtURL(package_.url(), 0, urlOf(package_ / backup), error);
    }
    Tree now() const { return contentOf(package_.path()); }
    const Tree& before() const { return before_; }
    const Tree& after() const { return after_; }
    const PackageOnDisk& package() const { return package_; }
    auto interrupted() const { return Info::interruptedExchangeForBundleURL(package_.url(), 0); }

    /// Each content exists exactly once, wherever it is, and nothing else but the record.
    void expectAllThere() const
    {
        std::multimap<std::string, int> expected, found;
        for (const auto& [path, content] : before_)
            expected.emplace(content, 0);
        for (const auto& [path, content] : now())
            if (path.find(".exchange.dummy") == path.npos)
                found.emplace(content, 0);
        EXPECT_EQ(found, expected);
    }

private:
    PackageOnDisk package_;
    Tree before_, after_;
};

int failExchange(const char*, const char*)
{
    errno = EINVAL;
    return -1;
}

TEST(ProjectExchange, TakesEverythingWithIt)
{
    const Exchange exchange;
    Tree expected;
    const std::string mine = std::string(kAlternative) + '/', first = std::string(kFirst) + '/';
    for (const char* item : {"ProjectData", "MetaData.plist", "MetaData.bak", "ARA Files/one", "Autosave/data"})
        expected[first + item] = std::string("mine: ") + item;
    for (const char* item : {"ProjectData", "MetaData.plist", "ARA Files/two"})
        expected[mine + item] = std::string("first: ") + item;
    expected[mine + "WindowImage.jpg"] = "mine: WindowImage.jpg";
    expected[std::string(kSecond) + "/ProjectData"] = "second: ProjectData";
    EXPECT_EQ(exchange.after(), expected);
    EXPECT_FALSE(exchange.interrupted());
}

/// Every call that changes something, with and without an exchange of names in one step.
using Step = std::tuple<Call, bool>;

class ProjectExchangeFaults : public testing::TestWithParam<Step> {
protected:
    /// An exchange in which the call fails from the `nth` time on, `times` times; `wasLast` if it was called less
    /// often.
    bool exchangeWithFault(const Exchange& exchange, int error, int nth, int times)
    {
        const auto [call, canExchange] = GetParam();
        FaultInjector faults;
        if (!canExchange)
            systemCalls().exchangeNames = failExchange;
        faults.fail(call, error, nth, times);
        Error told;
        const bool done = exchange.exchange(kFirst, &told);
        EXPECT_EQ(told.domain, done ? "" : ErrorDomain::system);
        EXPECT_EQ(told.code, done ? 0 : error) << told.description;
        wasLast = nth > faults.calls(call);
        return done;
    }

    bool wasLast = false;
};

TEST_P(ProjectExchangeFaults, OneFailureChangesNothing)
{
    for (const int error : {ENOSPC, EACCES}) {
        wasLast = false;
        for (int nth = 1; !wasLast; ++nth) {
            const Exchange exchange;
            const bool done = exchangeWithFault(exchange, error, nth, 1);
            EXPECT_EQ(exchange.now(), done ? exchange.after() : exchange.before()) << nth;
            EXPECT_FALSE(exchange.interrupted());
        }
    }
}

TEST_P(ProjectExchangeFaults, NothingWorksFromThereOn)
{
    const QuietLog quiet;
    for (int nth = 1; !wasLast; ++nth)
        for (const bool sameAgain : {true, false}) {
            const Exchange exchange;
            const bool done = exchangeWithFault(exchange, EACCES, nth, 1 << 20);
            exchange.expectAllThere();
            const auto interrupted = exchange.interrupted();
            if (interrupted) {
                EXPECT_FALSE(done);
                EXPECT_EQ(interrupted->backupURL->posixPath(), exchange.package() / kFirst);
            } else {
                EXPECT_EQ(exchange.now(), done ? exchange.after() : exchange.before());
            }
            if (!done && sameAgain) {
                EXPECT_TRUE(exchange.exchange());
                EXPECT_EQ(exchange.now(), exchange.after()) << nth;
            } else if (!done) { // undone first, then what was asked for
                EXPECT_TRUE(exchange.exchange(kSecond));
                EXPECT_TRUE(exchange.exchange(kSecond));
                EXPECT_EQ(exchange.now(), exchange.before()) << nth;
            }
            EXPECT_FALSE(exchange.interrupted());
        }
}

INSTANTIATE_TEST_SUITE_P(Steps, ProjectExchangeFaults,
                         testing::Combine(testing::Values(Call::createFile, Call::pwrite, Call::fsync, Call::close,
                                                          Call::syncFolder, Call::renameWithoutReplacing,
                                                          Call::exchangeNames, Call::removeFile),
                                          testing::Bool()));

TEST(ProjectExchange, KilledAtEveryChange)
{
    const QuietLog quiet;
    for (const bool canExchange : {true, false}) {
        bool survived = false;
        for (int change = 1; !survived; ++change) {
            const Exchange exchange;
            const pid_t child = fork();
            if (child == 0) {
                FaultInjector faults;
                if (!canExchange)
                    faults.fail(Call::exchangeNames, EINVAL, 1, 1 << 20);
                faults.killAt(change);
                _exit(exchange.exchange() ? 0 : 1);
            }
            int status = 0;
            ASSERT_EQ(waitpid(child, &status, 0), child);
            survived = WIFEXITED(status);
            exchange.expectAllThere();
            // A process killed after the last change leaves nothing to settle: the record is gone and all is done.
            if (!survived && (exchange.interrupted() || exchange.now() != exchange.after())) {
                EXPECT_TRUE(exchange.exchange());
            }
            EXPECT_EQ(exchange.now(), exchange.after()) << change;
            ASSERT_LT(change, 60);
        }
    }
}

TEST(ProjectExchange, WhatWasReplacedMeanwhileStays)
{
    const QuietLog quiet;
    const Exchange exchange;
    {
        FaultInjector faults;
        faults.fail(Call::exchangeNames, EACCES, 2, 1 << 20); // "ARA Files": the project data has moved
        faults.fail(Call::renameWithoutReplacing, EACCES, 3, 1 << 20);
        EXPECT_FALSE(exchange.exchange());
    }
    ASSERT_TRUE(exchange.interrupted());
    EXPECT_FALSE(exchange.interrupted()->isComplete);
    // An application saves: a new file replaces the project data.
    exchange.package().write(std::string(kAlternative) + "/new", std::string_view("saved anew"));
    fs::rename(exchange.package() / (std::string(kAlternative) + "/new"),
               exchange.package() / (std::string(kAlternative) + "/ProjectData"));
    const Tree before = exchange.now();
    Error error;
    EXPECT_FALSE(exchange.exchange(kFirst, &error));
    EXPECT_NE(error.description.find("has been replaced since"), std::string::npos);
    Tree after = exchange.now();
    EXPECT_EQ(after.size() + 1, before.size()); // the record is gone
    EXPECT_FALSE(exchange.interrupted());
    EXPECT_TRUE(exchange.exchange()); // and the way is free
}

TEST(ProjectExchange, RecordsFromElsewhereMoveNothing)
{
    const QuietLog quiet;
    const std::string record = std::string(kAlternative) + "/.exchange.dummy";
    const auto items = [](std::int64_t number) { return Array(5, Array{number, number}); };
    const Value cases[] = {
        "text",
        Dictionary{{"Backup", "../../.."}, {"Items", items(0)}},
        Dictionary{{"Backup", "/etc"}, {"Items", items(0)}},
        Dictionary{{"Backup", "00"}, {"Items", items(1)}},
        Dictionary{{"Backup", "00"}, {"Items", Array(4, Array{1, 1})}},
        Dictionary{{"Backup", "00"}, {"Items", Array(5, Array{1})}},
        Dictionary{{"Backup", "00"}, {"Items", Array(5, Array{"1", "2"})}},
        Dictionary{{"Backup", std::string("0\0", 2)}, {"Items", items(0)}},
    };
    for (const Value& value : cases) {
        const Exchange exchange;
        exchange.package().write(record, *writePropertyList(value, PropertyListFormat::binary));
        EXPECT_FALSE(exchange.exchange());
        fs::remove(exchange.package() / record); // forgotten already, or not understood
        EXPECT_EQ(exchange.now(), exchange.before());
    }
}

TEST(ProjectExchange, ThreeRenamingsWhereNamesCannotBeExchanged)
{
    for (const int error : {EINVAL, ENOSYS, ENOTSUP, EACCES}) {
        const Exchange exchange;
        FaultInjector faults;
        faults.fail(Call::exchangeNames, error, 1, 1 << 20);
        EXPECT_EQ(exchange.exchange(), error != EACCES);
        EXPECT_EQ(exchange.now(), error != EACCES ? exchange.after() : exchange.before());
    }
}

/// An exchange with the first backup that reached its end or its middle, and whose record is left.
class CutShort : public Exchange {
public:
    explicit CutShort(bool isComplete, const std::string& backup = kFirst)
    {
        FaultInjector faults;
        faults.fail(Call::removeFile, EACCES, 2, 1 << 20);
        faults.fail(Call::exchangeNames, EACCES, isComplete ? 4 : 2, 1 << 20);
        faults.fail(Call::renameWithoutReplacing, EACCES, isComplete ? 4 : 2, 1 << 20);
        EXPECT_FALSE(Info::exchangeDataOfProjectAtURL(package().url(), 0,
                                                      urlOf(backup.starts_with('/') ? backup : package() / backup)));
        EXPECT_TRUE(interrupted());
    }
    bool settle(SettleExchange how, const std::string& backup = "", Error* error = nullptr) const
    {
        return Info::settleInterruptedExchangeForBundleURL(package().url(), 0, how,
                                                           backup.empty() ? nullptr : urlOf(backup), error);
    }
};

TEST(ProjectExchange, ACompleteOneIsNotUndoneLater)
{
    const QuietLog quiet;
    const CutShort exchange(true);
    ASSERT_TRUE(exchange.interrupted()->isComplete);
    EXPECT_TRUE(exchange.exchange(kSecond));
    EXPECT_TRUE(exchange.exchange(kSecond));
    EXPECT_EQ(exchange.now(), exchange.after());
}

TEST(ProjectExchange, OneThatWasCutShortIsSettledByItself)
{
    const QuietLog quiet;
    for (const SettleExchange how : {SettleExchange::complete, SettleExchange::undo, SettleExchange::forget}) {
        const CutShort exchange(false);
        const Tree middle = exchange.now();
        EXPECT_TRUE(exchange.settle(how));
        EXPECT_FALSE(exchange.interrupted());
        exchange.expectAllThere();
        if (how != SettleExchange::forget)
            EXPECT_EQ(exchange.now(), how == SettleExchange::complete ? exchange.after() : exchange.before());
        else
            EXPECT_EQ(exchange.now().size() + 1, middle.size()); // the record alone
        EXPECT_FALSE(exchange.settle(how));
    }
    const CutShort exchange(false);
    exchange.package().write(std::string(kAlternative) + "/.exchange.dummy", std::string_view("nonsense"));
    EXPECT_FALSE(exchange.exchange());
    EXPECT_FALSE(exchange.settle(SettleExchange::complete));
    EXPECT_TRUE(exchange.settle(SettleExchange::forget));
}

TEST(ProjectExchange, APathInARecordIsFollowedWhenItIsNamed)
{
    const QuietLog quiet;
    const TemporaryFolder other;
    fs::create_directory(other / "backup");
    other.write("backup/ProjectData", "elsewhere");
    fs::create_directory_symlink(other.path(), other / "link");
    const CutShort exchange(false, other / "backup");
    EXPECT_FALSE(exchange.settle(SettleExchange::complete));
    EXPECT_FALSE(exchange.settle(SettleExchange::complete, exchange.package() / kFirst));
    EXPECT_FALSE(exchange.exchange(kFirst));
    EXPECT_TRUE(exchange.settle(SettleExchange::undo, other / "link/backup")); // the same folder
    EXPECT_EQ(exchange.now(), exchange.before());
    EXPECT_EQ(textOf(readFile(other / "backup/ProjectData")), "elsewhere");
}

TEST(ProjectExchange, WhatStandsAsideIsNotTouched)
{
    const Exchange exchange;
    exchange.package().write(std::string(kAlternative) + "/ProjectData.dummy", std::string_view("somebody's"));
    const Tree before = exchange.now();
    Error error;
    EXPECT_FALSE(exchange.exchange(kFirst, &error));
    EXPECT_EQ(error.code, EEXIST);
    EXPECT_EQ(exchange.now(), before);
}

} // namespace
