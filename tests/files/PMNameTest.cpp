#include "files/PMName.h"

#include "support/FaultInjection.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

std::string contentOf(CFileIO& file)
{
    std::string content(static_cast<std::size_t>(file.GetEOF()), '\0');
    EXPECT_EQ(file.Read(content.data(), 0, static_cast<long>(content.size()), nullptr), kStatusOK);
    return content;
}

} // namespace

TEST(PMName, ElementsBetweenSeparators)
{
    const struct {
        const char* name;
        std::vector<std::string> elements;
    } cases[] = {{nullptr, {}},      {"", {}},           {"/a/b/", {"a", "b"}}, {"a//b", {"a", "", "b"}},
                 {"//a", {"", "a"}}, {"a//", {"a", ""}}, {"//", {""}}};
    for (const auto& c : cases) {
        std::list<PMName> out;
        out.emplace_back("first");
        const PMName name(c.name);
        name.GetElements('/', out);
        ASSERT_EQ(out.size(), c.elements.size() + 1) << c.name;
        EXPECT_TRUE(std::equal(c.elements.begin(), c.elements.end(), std::next(out.begin()),
                               [](const std::string& a, const PMName& b) { return a == b.Get(); }))
            << c.name;
    }
}

TEST(PMName, StoredForm)
{
    const struct {
        const char* name;
        unsigned char shortLength;
        std::string stored;
    } cases[] = {{"kick", 1, std::string("\4\0kick", 6)},
                 {"kick", 0, std::string("\4\0\0\0\0\0\0\0kick", 12)},
                 {nullptr, 1, std::string(2, '\0')},
                 {nullptr, 0, std::string(8, '\0')}};
    for (const auto& c : cases) {
        CFileIO file(CFileRef::None, 0x8001);
        file.SetWCache(5);
        EXPECT_EQ(PMName(c.name).ToFile(file, c.shortLength), kStatusOK);
        EXPECT_EQ(file.FlushWCache(), kStatusOK);
        EXPECT_EQ(contentOf(file), c.stored);
        file.SetMark(0);
        PMName read("old");
        EXPECT_EQ(read.FromFile(file, c.shortLength), kStatusOK);
        EXPECT_STREQ(read, c.name != nullptr ? c.name : "old"); // a length of 0 keeps the old text
        EXPECT_EQ(file.GetMark(), file.GetEOF());
    }
}

TEST(PMName, BadLengths)
{
    const auto stored = [](const std::string& bytes, unsigned char shortLength, PMName& name) {
        CFileIO file(CFileRef::None, 0x8001);
        file.Write(bytes.data(), 0, static_cast<long>(bytes.size()));
        return name.FromFile(file, shortLength);
    };
    PMName name("old");
    EXPECT_THROW(stored(std::string(8, '\xFF') + "kick", 0, name), PMNameException);
    // A length far beyond the file must not be allocated.
    EXPECT_EQ(stored(std::string("\0\0\0\0\0\0\0\x40", 8) + "kick", 0, name), kStatusEndOfFile);
    EXPECT_EQ(stored(std::string("\5\0kick", 6), 1, name), kStatusEndOfFile);
    EXPECT_EQ(stored(std::string("\4\0kick", 6), 0, name), kStatusEndOfFile);
    EXPECT_STREQ(name, "old");

    CFileIO file(CFileRef::None, 0x8001);
    EXPECT_EQ(PMName(std::string(65536, 'n')).ToFile(file, 1), kStatusBadName);
    EXPECT_EQ(file.GetEOF(), 0);
    EXPECT_EQ(PMName(std::string(65535, 'n')).ToFile(file, 1), kStatusOK);
    EXPECT_EQ(file.GetEOF(), 65537);
}
