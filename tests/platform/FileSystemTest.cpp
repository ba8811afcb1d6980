#include "platform/FileSystem.h"
#include "support/TemporaryFolder.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

#include <cstdlib>

namespace fs = std::filesystem;
using namespace platform;

TEST(FileHandle, FindsTheItemAfterARenameInItsFolder)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("take.wav", "one");
    FileHandle handle;
    ASSERT_TRUE(makeFileHandle(path.c_str(), handle));
    EXPECT_EQ(pathOf(urlFromFileHandle(handle)), path);
    EXPECT_EQ(catalogName(handle).utf8(), "take.wav");

    // Another file takes the name; the handle follows the item.
    fs::rename(path, folder / "renamed.wav");
    folder.write("take.wav", "two");
    EXPECT_EQ(pathOf(urlFromFileHandle(handle)), folder / "renamed.wav");
    EXPECT_EQ(catalogName(handle).utf8(), "renamed.wav");

    fs::remove(folder / "renamed.wav");
    EXPECT_EQ(urlFromFileHandle(handle), nullptr);
    EXPECT_TRUE(catalogName(handle).isNull());
}

TEST(SymbolicLinks, AreResolvedAsFarAsThePathExists)
{
    const TemporaryFolder folder;
    fs::create_directories(folder / "real/inner");
    folder.write("real/file", "");
    fs::create_directory_symlink("real", folder / "link");
    fs::create_symlink("gone", folder / "dangling");
    fs::create_symlink("loop", folder / "loop");

    struct Case {
        const char* path;
        const char* expected;
    };
    const Case cases[] = {{"link/file", "real/file"},
                          {"real/file", "real/file"}, // without a link, in one call of the system …
                          {"real/missing/x", "real/missing/x"},
                          {"real/inner/", "real/inner"}, // … and what that call would leave as it is
                          {"real//inner/.././file", "real/file"},
                          {"link/inner/../file", "real/file"},
                          {"link/missing/x", "real/missing/x"},
                          {"link/missing/../other//y/.", "real/other/y"},
                          {"dangling", "dangling"},
                          {"loop/x", "loop/x"},
                          {"link/file/below-a-file", "real/file/below-a-file"}};
    for (const Case& c : cases)
        EXPECT_EQ(resolvingSymbolicLinksInPath(String::fromUTF8(folder / c.path)).utf8(), folder / c.expected)
            << c.path;
    EXPECT_EQ(resolvingSymbolicLinksInPath(String::fromUTF8("/no-such-item/../..")).utf8(), "/");
    EXPECT_EQ(resolvingSymbolicLinksInPath(String::fromUTF8("a/../b")).utf8(), "a/../b");
    EXPECT_TRUE(resolvingSymbolicLinksInPath(nullptr).isNull());

    const URLRef inner = resolvingSymbolicLinks(*urlOf(folder / "link/inner"));
    EXPECT_EQ(pathOf(inner), folder / "real/inner");
    EXPECT_TRUE(inner->hasDirectoryPath());
    EXPECT_EQ(resolvingSymbolicLinks(*urlOf(folder / "dangling")), nullptr);
    EXPECT_EQ(pathOf(filePathURL(urlOf(folder / "dangling"))), folder / "dangling");
    EXPECT_EQ(filePathURL(urlOf(folder / "missing")), nullptr);
    EXPECT_EQ(filePathURL(nullptr), nullptr);
}

TEST(DisplayName, ComesFromDesktopEntriesInTheUsersLanguage)
{
    const TemporaryFolder folder;
    fs::create_directory(folder / "music");
    const std::string entry = folder.write("music/.directory", "# a comment\n[Other]\nName=Wrong\n[Desktop Entry]\n"
                                                               "Name = My\\sMusic\r\nName[de]=Meine Musik\n"
                                                               "Name[de_AT]=Mei Musi\nName[sr@latin]=Muzika\n");
    const std::pair<const char*, const char*> cases[] = {{"C", "My Music"},
                                                         {"de_DE.UTF-8", "Meine Musik"},
                                                         {"de_AT", "Mei Musi"},
                                                         {"sr_RS.UTF-8@latin", "Muzika"},
                                                         {"fr_FR", "My Music"}};
    for (const auto& [locale, expected] : cases) {
        ::setenv("LC_ALL", locale, 1);
        EXPECT_EQ(displayName(*urlOf(folder / "music", true)).utf8(), expected) << locale;
    }
    ::unsetenv("LC_ALL");
    EXPECT_EQ(displayName(*urlOf(folder.write("x.wav", ""))).utf8(), "x.wav");
    EXPECT_TRUE(displayName(*urlOf(folder / "missing")).isNull());

    // A missing or far too long entry leaves the folder its own name.
    for (const std::string& content : {std::string("[Desktop Entry"), std::string("Name=x"), std::string(100000, 'x'),
                                       std::string("[Desktop Entry]\nName=\xFF")}) {
        folder.write("music/.directory", content);
        EXPECT_EQ(displayName(*urlOf(folder / "music", true)).utf8(), "music");
    }
}
