#include "platform/URL.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

using namespace platform;
using namespace std::string_literals;

namespace {

URLRef fromPath(const std::string& path, bool isDirectory = false, const URLRef& base = nullptr)
{
    return URL::createWithFileSystemPath(String::fromUTF8(path), PathStyle::posix, isDirectory, base);
}

std::string textOf(const URLRef& url)
{
    return url ? url->string() : "(null)";
}

} // namespace

TEST(URL, PathsBecomeTextAndComeBack)
{
    struct Case {
        std::string path;
        bool isDirectory;
        std::string kept; // as copyFileSystemPath gives it
        std::string text;
    };
    const Case cases[] = {
        {"/", false, "/", "file:///"}, // the root is always a directory
        {"/a/b", false, "/a/b", "file:///a/b"},
        {"/a/b", true, "/a/b", "file:///a/b/"},
        {"//a//b/", true, "/a/b", "file:///a/b/"},
        {"/a/./../b", false, "/a/./../b", "file:///a/./../b"},
        {"/100% ?#;[x]:\n", false, "/100% ?#;[x]:\n", "file:///100%25%20%3F%23%3B%5Bx%5D%3A%0A"},
        {"/%2F%41", false, "/%2F%41", "file:///%252F%2541"}, // a path has no escapes
        {"/\u00DCber/\U0001F3B5", false, "/\u00DCber/\U0001F3B5", "file:///%C3%9Cber/%F0%9F%8E%B5"},
        {"a\\b", false, "a\\b", "a%5Cb"},
        {"a:b/c", false, "a:b/c", "a%3Ab/c"}, // no scheme
        {"/a/..", false, "/a/..", "file:///a/../"},
        {"/" + std::string(5000, 'x'), false, "/" + std::string(5000, 'x'), "file:///" + std::string(5000, 'x')},
    };
    for (const Case& c : cases) {
        const URLRef url = fromPath(c.path, c.isDirectory);
        ASSERT_NE(url, nullptr) << c.path;
        EXPECT_EQ(pathOf(url), c.kept);
        EXPECT_EQ(url->posixPath(), c.kept);
        EXPECT_EQ(url->string(), c.text);
        EXPECT_EQ(url->hasDirectoryPath(), c.text.ends_with('/')) << c.path;
        EXPECT_EQ(url->hasAbsolutePath(), c.path[0] == '/');
        EXPECT_EQ(url->isFileURL(), c.path[0] == '/');
        const URLRef again = URL::createWithString(c.text);
        ASSERT_NE(again, nullptr) << c.text;
        EXPECT_EQ(*again, *url) << c.text;
        EXPECT_EQ(again->hash(), url->hash());
    }
    EXPECT_NE(*fromPath("/a"), *fromPath("/a", true));
    EXPECT_EQ(fromPath("", true), nullptr);
    EXPECT_EQ(fromPath("/a\0b"s), nullptr);
    EXPECT_EQ(URL::createWithFileSystemPath(nullptr, PathStyle::posix, false), nullptr);
    EXPECT_EQ(URL::createWithFileSystemPath(String::fromFileSystemRepresentation("/\xFF"), PathStyle::posix, false),
              nullptr);
}

TEST(URL, PathsThatAreNoTextAreKeptAsBytes)
{
    const URLRef url = URL::createWithFileSystemBytes("/a\xC4//\xE4.wav", false);
    ASSERT_NE(url, nullptr);
    EXPECT_EQ(url->posixPath(), "/a\xC4/\xE4.wav");
    EXPECT_EQ(url->string(), "file:///a%C4/%E4.wav");
    EXPECT_EQ(url->deletingLastPathComponent()->posixPath(), "/a\xC4");
    EXPECT_TRUE(url->copyFileSystemPath(PathStyle::posix).isNull() && url->copyLastPathComponent().isNull());
    EXPECT_EQ(*URL::createWithFileSystemBytes("/\u00E4/", true), *fromPath("/\u00E4", true));
    for (const std::string& refused : {""s, "a"s, "/a\0b"s})
        EXPECT_EQ(URL::createWithFileSystemBytes(refused, false), nullptr);
}

TEST(URL, TextIsReadStrictlyAndKeptInOneForm)
{
    struct Case {
        std::string text;
        std::string path;
        std::string canonical;
    };
    const Case cases[] = {
        {"FILE:///x", "/x", "file:///x"},
        {"file:/x", "/x", "file:///x"},
        {"file://localhost/x", "/x", "file:///x"},
        {"file:////a//b", "/a/b", "file:///a/b"},
        {"file:///%c3%A4%41;v=1", "/\u00E4A;v=1", "file:///%C3%A4A%3Bv%3D1"},
        {"file:///\u00E4", "/\u00E4", "file:///%C3%A4"},
        {"file:///a/b?query#frag", "/a/b", "file:///a/b?query#frag"},
        {"file:///a/..", "/a/..", "file:///a/../"}, // dots name a folder
        {"/a%20b", "/a b", "file:///a%20b"},
        {"a/b", "a/b", "a/b"},
        {"http://host/a%2Fb/?x", "(null)", "http://host/a%2Fb/?x"},
        {"file://Server/share/x", "(null)", "file://server/share/x"}, // another host's file has no path here
    };
    for (const Case& c : cases) {
        const URLRef url = URL::createWithString(c.text);
        ASSERT_NE(url, nullptr) << c.text;
        EXPECT_EQ(pathOf(url), c.path) << c.text;
        EXPECT_EQ(url->posixPath(), c.path == "(null)" ? "" : c.path);
        EXPECT_EQ(url->string(), c.canonical);
        EXPECT_EQ(url->absoluteString(), c.canonical);
        EXPECT_EQ(*URL::createWithString(c.canonical), *url);
    }
    const std::string refused[] = {
        "",           "#f",           "file://",       "file:x",        "file:///a b", "file:///a\\b",
        "file:///%4", "file:///%zz",  "file:///a%2Fb", "file:///a%00b", "file:///%FF", "file:///a\0"s,
        "%2F",        "file://h:1/x", "//host/x",      "C:\\a"};
    for (const std::string& text : refused)
        EXPECT_EQ(URL::createWithString(text), nullptr) << text;
}

TEST(URL, BasesAreApplied)
{
    struct Case {
        std::string relative;
        std::string path;
        std::string text;
    };
    const URLRef base = fromPath("/music/set list", true);
    const Case cases[] = {
        {"a/b", "/music/set list/a/b", "a/b"},
        {"../x%20/", "/music/x ", "../x%20/"},
        {"../../../x", "/x", "../../../x"},
        {"..", "/music", "../"},
        {"/x", "/x", "file:///x"},
        {"../..", "/", "../../"},
        {"file:///y", "/y", "file:///y"},
        {"//server/z", "(null)", "file://server/z"},
    };
    for (const Case& c : cases) {
        const URLRef url = URL::createWithString(c.relative, base);
        ASSERT_NE(url, nullptr) << c.relative;
        EXPECT_EQ(pathOf(url), c.path) << c.relative;
        EXPECT_EQ(url->string(), c.text);
        EXPECT_EQ(url->baseURL(), url->hasAbsolutePath() ? nullptr : base) << c.relative;
        EXPECT_TRUE(url->isFileURL());
        EXPECT_EQ(textOf(URL::createWithString(url->absoluteString())), url->absoluteString());
        if (url->baseURL()) {
            EXPECT_EQ(*URL::createWithString(url->string(), fromPath("/music/set list", true)), *url);
            EXPECT_NE(*URL::createWithString(url->string(), fromPath("/music/set list/x", true)), *url);
            EXPECT_NE(*URL::createWithString(url->absoluteString()), *url);
        }
    }
    EXPECT_EQ(pathOf(fromPath("x", false, fromPath("/music/file"))), "/music/x"); // beside a file
    EXPECT_EQ(pathOf(fromPath("x", false, fromPath("b/", true))), "b/x");
    EXPECT_EQ(pathOf(fromPath("../x", false, fromPath("c", true, base))), "/music/set list/x");
    EXPECT_EQ(fromPath("x", false, base)->absoluteString(), "file:///music/set%20list/x");
    EXPECT_EQ(fromPath("/x", false, base)->baseURL(), nullptr);
    const URLRef remote = URL::createWithString("x", URL::createWithString("file://server/share/"));
    EXPECT_EQ(remote->absoluteString(), "file://server/share/x");
    EXPECT_EQ(fromPath("y", false, remote)->absoluteString(), "file://server/share/y");
    EXPECT_EQ(URL::createWithString("/x", URL::createWithString("file://server/share/"))->string(), "file://server/x");
    EXPECT_EQ(URL::createWithString("x", URL::createWithString("http://host/")), nullptr);
}

TEST(URL, PathStylesOfOtherSystems)
{
    struct Case {
        PathStyle style;
        std::string text;
        std::string posix; // "(none)": no URL; "(null)": a URL without a POSIX path
        std::string again; // the path in the style
    };
    const PathStyle windows = PathStyle::windows, colon = PathStyle::colon;
    const Case cases[] = {
        {windows, "C:\\a b\\c%", "/C:/a b/c%", "C:\\a b\\c%"},
        {windows, "c:/a\\", "/c:/a", "c:\\a"},
        {windows, "C:", "/C:", "C:\\"},
        {windows, "C:a", "(none)", ""}, // in a drive's current folder
        {windows, "\\a\\\\b", "/a/b", "\\a\\b"},
        {windows, "a\\..\\b", "a/../b", "a\\..\\b"},
        {windows, "\\\\Server\\share\\x", "(null)", "\\\\server\\share\\x"},
        {windows, "\\\\?\\C:\\a", "(none)", ""},
        {colon, "Disk:Folder:File", "/Volumes/Disk/Folder/File", "Disk:Folder:File"},
        {colon, "Disk", "/Volumes/Disk", "Disk:"},
        {colon, "Disk:a::b", "/Volumes/Disk/a/../b", "Disk:a::b"},
        {colon, "Disk::", "(none)", ""}, // out of its volume
        {colon, "Disk:4/4 Beats", "/Volumes/Disk/4:4 Beats", "Disk:4/4 Beats"},
        {colon, "Disk:a:..", "(none)", ""}, // names there, but not in POSIX
        {colon, ":rel:x", "rel/x", ":rel:x"},
        {colon, ":", ".", ":"},
        {colon, "::", "..", "::"},
        {colon, "::up", "../up", "::up"},
    };
    for (const Case& c : cases) {
        const URLRef url = URL::createWithFileSystemPath(String::fromUTF8(c.text), c.style, false);
        ASSERT_EQ(url == nullptr, c.posix == "(none)") << c.text;
        if (url) {
            EXPECT_EQ(pathOf(url), c.posix) << c.text;
            EXPECT_EQ(pathOf(url, c.style), c.again) << c.text;
        }
    }
    // A path that a style would read back differently has no form in it.
    for (const char* path : {"/a\\b", "C:/a", "a\\b"})
        EXPECT_EQ(pathOf(fromPath(path), windows), "(null)") << path;
    for (const char* path : {"/", "/a", "/Volumes", "/Volumes/.", "/Volumes/..", "/Volumes/a/../b"})
        EXPECT_EQ(pathOf(fromPath(path), colon), "(null)") << path;
    EXPECT_EQ(pathOf(fromPath("/a:b/C:"), windows), "\\a:b\\C:");
    EXPECT_EQ(pathOf(fromPath("/Volumes/D/a:b/./c"), colon), "D:a/b:c");
    EXPECT_EQ(pathOf(URL::createWithString("file://server/Volumes/x/y"), colon), "(null)");
}

TEST(URL, ComponentsAreTakenOffAndPutOn)
{
    struct Case {
        std::string text;
        std::string last;
        std::string extension; // "-": none
        std::string parent;
        std::string child; // with "x y.z" put on
    };
    const Case cases[] = {
        {"file:///", "/", "-", "file:///", "file:///x%20y.z"},
        {"file:///a/b.c.d/", "b.c.d", "d", "file:///a/", "file:///a/b.c.d/x%20y.z"},
        {"file:///a/b?q#f", "b", "-", "file:///a/", "file:///a/b/x%20y.z"},
        {"file:///a/..", "..", "-", "file:///a/../../", "file:///a/../x%20y.z"},
        {"file:///a/.", ".", "-", "file:///a/../", "file:///a/./x%20y.z"},
        {"file:///.hidden", ".hidden", "-", "file:///", "file:///.hidden/x%20y.z"},
        {"file://server/a", "a", "-", "file://server/", "file://server/a/x%20y.z"},
        {"a.b", "a.b", "b", "./", "a.b/x%20y.z"},
        {"./", ".", "-", "../", "x%20y.z"},
        {"http://host/a.b", "(null)", "-", "(null)", "(null)"},
    };
    const String name = String::fromUTF8("x y.z");
    for (const Case& c : cases) {
        const URLRef url = URL::createWithString(c.text);
        ASSERT_NE(url, nullptr) << c.text;
        EXPECT_EQ(url->copyLastPathComponent(), c.last == "(null)" ? String() : String::fromUTF8(c.last)) << c.text;
        EXPECT_EQ(url->copyPathExtension(), c.extension == "-" ? String() : String::fromUTF8(c.extension)) << c.text;
        EXPECT_EQ(textOf(url->deletingLastPathComponent()), c.parent) << c.text;
        EXPECT_EQ(textOf(url->appendingPathComponent(name, false)), c.child) << c.text;
    }
    const URLRef url = fromPath("/a");
    EXPECT_EQ(textOf(url->appendingPathComponent(String::fromUTF8("/b//c/"), true)), "file:///a/b/c/");
    for (const String& none : {String(), String::fromUTF8(""), String::fromUTF8("/"), String::fromUTF8("b\0"s)})
        EXPECT_EQ(url->appendingPathComponent(none, true), nullptr);
    const URLRef relative = fromPath("b/c", false, fromPath("/a", true));
    EXPECT_EQ(textOf(relative->deletingLastPathComponent()), "b/");
    EXPECT_EQ(pathOf(relative->deletingLastPathComponent()->deletingLastPathComponent()), "/a");
    EXPECT_EQ(pathOf(relative->appendingPathComponent(name, false)), "/a/b/c/x y.z");
}
