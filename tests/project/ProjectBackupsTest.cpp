#include "PackageOnDisk.h"
#include "platform/Log.h"
#include "support/FaultInjection.h"

namespace fs = std::filesystem;

namespace {

using namespace platform;
using Info = ProjectInformation;

class Backups {
public:
    /// Names, oldest first; `sameTime` gives all the same time.
    explicit Backups(const std::vector<std::string>& names, bool sameTime = false)
    {
        const auto start = fs::file_time_type::clock::now() - std::chrono::hours(1);
        int number = 0;
        for (const std::string& name : names) {
            package_.write(item(name) + "/ProjectData", name);
            package_.write(item(name) + "/ARA Files/deep/er", name);
            fs::last_write_time(package_ / (item(name) + "/ProjectData"),
                                start + std::chrono::seconds(sameTime ? 0 : number++));
        }
    }
    static std::string item(const std::string& name) { return "Alternatives/000/Project File Backups/" + name; }
    std::string path(const std::string& name) const { return package_ / item(name); }

    std::vector<std::string> names() const
    {
        std::vector<std::string> names;
        for (const ProjectBackup& backup : Info::backupsForBundleURL(package_.url(), 0))
            names.push_back(fs::path(backup.url->posixPath()).filename());
        return names;
    }
    std::string next(int most, PurgeOldBackups purge) const
    {
        const URLRef url = Info::urlForNewBackupForBundleURL(package_.url(), 0, CreateDirectories::no, most, purge);
        return url ? fs::path(url->posixPath()).filename().string() : "none";
    }
    const PackageOnDisk& package() const { return package_; }

private:
    PackageOnDisk package_;
};

using Names = std::vector<std::string>;

TEST(ProjectBackups, ListedByDateThenName)
{
    EXPECT_EQ(Backups({"02", "00", "10"}).names(), (Names{"02", "00", "10"}));
    const Backups backups({"b", "10", "a", "02"}, true);
    backups.package().write(Backups::item(".hidden") + "/ProjectData", std::string_view());
    backups.package().write(Backups::item("empty") + "/MetaData.plist", std::string_view());
    backups.package().write(Backups::item("file"), std::string_view());
    fs::create_symlink("circle", backups.path("circle"));
    EXPECT_EQ(backups.names(), (Names{"02", "10", "a", "b"}));
    EXPECT_TRUE(Info::backupsForBundleURL(backups.package().url(), -1).empty());
}

TEST(ProjectBackups, NewNames)
{
    constexpr auto keep = PurgeOldBackups::no, purge = PurgeOldBackups::yes;
    const struct {
        Names there;
        int most;
        PurgeOldBackups purges;
        const char* name;
        Names left;
    } cases[] = {
        {{}, 3, keep, "00", {}},
        {{"02", "01"}, 3, keep, "00", {"02", "01"}}, // counting up comes round
        {{"00", "02"}, 4, keep, "03", {"00", "02"}}, // 2 is taken
        {{"00", "01", "02"}, 3, keep, "none", {"00", "01", "02"}},
        {{"00", "01", "02"}, 3, purge, "00", {"01", "02"}},
        {{"01", "02", "00"}, 3, purge, "01", {"02", "00"}}, // the oldest goes
        {{"00", "01", "02", "03"}, 2, purge, "01", {"03"}}, // as many as are too many
        {{"00"}, 0, purge, "none", {"00"}},
        {{"00"}, 2147483647, purge, "01", {"00"}},
        {{"mine", "yours", "00"}, 3, keep, "none", {"mine", "yours", "00"}}, // 01 is free, but there are three
    };
    for (const auto& test : cases) {
        const Backups backups(test.there);
        EXPECT_EQ(backups.next(test.most, test.purges), test.name);
        EXPECT_EQ(backups.names(), test.left);
        EXPECT_TRUE(std::string_view(test.name) == "none" || !fs::exists(backups.path(test.name)));
    }
}

TEST(ProjectBackups, WithoutANameNothingIsDeleted)
{
    const Backups backups({"05"});
    backups.package().write(Backups::item("00") + "/MetaData.plist", std::string_view("no backup"));
    EXPECT_EQ(backups.next(1, PurgeOldBackups::yes), "none");
    EXPECT_EQ(backups.names(), Names{"05"});
}

TEST(ProjectBackups, PurgingKeepsTheOneThatWasMadeAndTheOneChangedLast)
{
    const auto purge = [](const Backups& backups, int most, const char* kept) {
        EXPECT_TRUE(Info::purgeBackupsForBundleURL(backups.package().url(), 0, most, urlOf(backups.path(kept))));
        return backups.names();
    };
    // Oldest data first: an exchange has just put old data into 01.
    const Names there{"00", "01", "02", "03"};
    for (const auto& [most, left] : {std::pair(4, there), std::pair(3, Names{"00", "01", "03"}),
                                     std::pair(2, Names{"00", "01"}), std::pair(1, Names{"00"})}) {
        const Backups backups(there);
        for (const std::string& name : there)
            fs::last_write_time(backups.path(name),
                                fs::file_time_type::clock::now() + std::chrono::hours(name == "01" ? 0 : -1));
        EXPECT_EQ(purge(backups, most, "00"), left) << most;
    }
}

TEST(ProjectBackups, NothingBehindALinkIsTouched)
{
    for (const char* linked : {"Project File Backups", "Project File Backups/00"}) {
        const Backups backups({"00", "01"});
        backups.package().write("Alternatives/000/ProjectData", std::string_view("mine"));
        const fs::path place = backups.package() / (std::string("Alternatives/000/") + linked);
        const fs::path elsewhere = backups.package().folder() / "elsewhere";
        fs::rename(place, elsewhere);
        fs::create_directory_symlink(elsewhere, place);
        const auto count = [&] {
            return std::distance(fs::recursive_directory_iterator(elsewhere), fs::recursive_directory_iterator());
        };
        const auto before = count();
        const bool isAll = std::string_view(linked).ends_with("Backups");
        EXPECT_EQ(backups.next(1, PurgeOldBackups::yes), "none"); // 00 is the link's name
        EXPECT_EQ(Info::purgeBackupsForBundleURL(backups.package().url(), 0, 1), !isAll);
        Error error;
        EXPECT_FALSE(Info::exchangeDataOfProjectAtURL(backups.package().url(), 0, urlOf(backups.path("00")), &error));
        EXPECT_NE(error.description.find("is a link"), std::string::npos) << error.description;
        EXPECT_EQ(count(), before);
    }
}

TEST(ProjectBackups, ADeletionCutShortLeavesNoHalfBackup)
{
    const Backups backups({"00", "01"});
    {
        FaultInjector faults;
        faults.fail(Call::removeFile, EIO);
        EXPECT_EQ(backups.next(2, PurgeOldBackups::yes), "none");
    }
    EXPECT_EQ(backups.names(), Names{"01"});
    EXPECT_TRUE(fs::exists(backups.path(".deleted-00"))); // hidden
    backups.package().write(Backups::item("00") + "/ProjectData", std::string_view("newer"));
    EXPECT_EQ(backups.next(1, PurgeOldBackups::yes), "00");
    EXPECT_FALSE(fs::exists(backups.path(".deleted-00")));
}

TEST(ProjectBackups, OneOfAnInterruptedExchangeIsNotPurged)
{
    const Backups backups({"00", "01"});
    backups.package().write("Alternatives/000/ProjectData", std::string_view("mine"));
    {
        FaultInjector faults;
        faults.fail(Call::removeFile, EACCES, 2, 100);             // the record stays
        faults.fail(Call::renameWithoutReplacing, EACCES, 3, 100); // nor is anything undone
        faults.fail(Call::exchangeNames, EACCES, 2, 100);
        EXPECT_FALSE(Info::exchangeDataOfProjectAtURL(backups.package().url(), 0, urlOf(backups.path("00"))));
    }
    const auto interrupted = Info::interruptedExchangeForBundleURL(backups.package().url(), 0);
    ASSERT_TRUE(interrupted);
    EXPECT_TRUE(interrupted->isComplete);
    EXPECT_EQ(backups.next(2, PurgeOldBackups::yes), "01");
    EXPECT_EQ(backups.names(), Names{"00"});
}

TEST(ProjectBackups, NorOneWhoseExchangeWasSpeltThroughALinkOrCannotBeRead)
{
    const Backups backups({"00", "01"});
    backups.package().write("Alternatives/000/ProjectData", std::string_view("mine"));
    const std::string link = backups.package().folder() / "Link.fuguex";
    fs::create_directory_symlink(backups.package().path(), link);
    {
        FaultInjector faults;
        faults.fail(Call::removeFile, EACCES, 2, 100);
        faults.fail(Call::renameWithoutReplacing, EACCES, 3, 100);
        faults.fail(Call::exchangeNames, EACCES, 2, 100);
        EXPECT_FALSE(
            Info::exchangeDataOfProjectAtURL(backups.package().url(), 0, urlOf(link + '/' + Backups::item("00"))));
    }
    const auto interrupted = Info::interruptedExchangeForBundleURL(backups.package().url(), 0);
    ASSERT_TRUE(interrupted);
    EXPECT_EQ(interrupted->backupURL->posixPath(), backups.path("00")); // by its name, however it was spelt
    EXPECT_TRUE(Info::purgeBackupsForBundleURL(backups.package().url(), 0, 1));
    EXPECT_TRUE(fs::exists(backups.path("00") + "/ProjectData"));
    backups.package().write("Alternatives/000/.exchange.dummy", std::string_view("nonsense"));
    ASSERT_TRUE(Info::interruptedExchangeForBundleURL(backups.package().url(), 0));
    EXPECT_FALSE(Info::interruptedExchangeForBundleURL(backups.package().url(), 0)->backupURL);
    EXPECT_EQ(backups.next(1, PurgeOldBackups::yes), "none");
    EXPECT_TRUE(Info::purgeBackupsForBundleURL(backups.package().url(), 0, 1));
    EXPECT_TRUE(fs::exists(backups.path("00") + "/ProjectData"));
}

} // namespace
