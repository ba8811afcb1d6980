#include "platform/SecureHash.h"
#include "platform/FileCoordination.h"
#include "support/Hex.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <filesystem>

namespace {

using namespace platform;

URLRef urlOf(const std::string& path)
{
    return URL::createWithFileSystemPath(String::fromUTF8(path), PathStyle::posix, false);
}

// FIPS 180-2, appendix B: one block, two blocks, many blocks.
TEST(SecureHash, TheStandardsExamples)
{
    const struct {
        std::string text;
        const char* digest;
    } cases[] = {
        {"", "e3b0c44298fc1c149afbf4c8996fb92427ae41e4649b934ca495991b7852b855"},
        {"abc", "ba7816bf8f01cfea414140de5dae2223b00361a396177a9cb410ff61f20015ad"},
        {"abcdbcdecdefdefgefghfghighijhijkijkljklmklmnlmnomnopnopq",
         "248d6a61d20638b8e5c026930c3e6039a33ce45964ff2167f6ecedd419db06c1"},
        {std::string(1000000, 'a'), "cdc76e5c9914fb9281a1c7e284d73e67f1809a48a497200e046d39ccc7112cd0"},
    };
    for (const auto& each : cases)
        EXPECT_EQ(toHex(sha256(bytesOf(each.text))), each.digest) << each.text.substr(0, 60);
}

// The key of a lock: should it change, processes with another version of the library would no longer meet.
TEST(SecureHash, ThePathsBytesAreTheKey)
{
    const struct {
        std::string path;
        const char* digest; // of the UTF-8, as other programs compute it
    } cases[] = {
        {"/", "8a5edab282632443219e051e4ade2d1d5bbc671c781051bf1437897cbdfea0f1"},
        {"/Volumes/Lieder/Fröhlich.wav", "ce336ab1f1cccec9da53dfe3f021a0ec368cdc94db420d2f9272c5932acccd50"},
    };
    for (const auto& each : cases) {
        const auto digest = fileSystemRepresentationSHA256(String::fromUTF8(each.path));
        ASSERT_TRUE(digest) << each.path;
        EXPECT_EQ(toHex(*digest), each.digest) << each.path;
        EXPECT_EQ(CoordinatedItem(urlOf(each.path)).key(), *digest) << each.path;
    }
    EXPECT_FALSE(fileSystemRepresentationSHA256(String()));
    EXPECT_FALSE(fileSystemRepresentationSHA256(String::fromUTF8(std::string_view("/a\0b", 4))));
    EXPECT_TRUE(fileSystemRepresentationSHA256(String::fromUTF8("")));
}

TEST(SecureHash, LinksShareTheKeyOfWhatTheyLeadTo)
{
    const TemporaryFolder folder;
    const std::filesystem::path root = std::filesystem::canonical(folder.path());
    std::filesystem::create_directory(root / "real");
    std::filesystem::create_directory_symlink("real", root / "link");
    const auto keyOf = [&](const char* name) { return CoordinatedItem(urlOf((root / name).string())).key(); };
    const auto real = fileSystemRepresentationSHA256(String::fromUTF8((root / "real/new.wav").string()));
    EXPECT_EQ(keyOf("real/new.wav"), *real); // there is no such file yet
    EXPECT_EQ(keyOf("link/new.wav"), *real);
    EXPECT_NE(keyOf("real/NEW.wav"), *real);
}

} // namespace
