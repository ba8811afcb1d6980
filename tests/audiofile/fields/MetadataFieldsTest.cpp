// Fields of files as hosts read them, and the errors that they are told of; what each chunk says is tested by the
// command.
#include "audiofile/CAudioFileIO.h"
#include "audiofile/fields/FileMetadata.h"
#include "platform/core/Status.h"
#include "support/ContainerBuilder.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace {

class MetadataFields : public testing::Test {
protected:
    std::string written(const Bytes& bytes) const { return folder.write("file.wav", bytes); }
    std::optional<FileMetadata> read(const std::string& path, const MetaGroups& groups = {})
    {
        return ReadMetadataFields(CFileRef(path.c_str(), false), groups, &error);
    }
    static std::string valueOf(const FileMetadata& metadata, std::string_view name)
    {
        const auto found = std::ranges::find(metadata.fields, name, &MetaField::fullName);
        return found != metadata.fields.end() ? std::get<std::string>(found->value) : "(none)";
    }

    TemporaryFolder folder;
    platform::Error error;
};

} // namespace

TEST_F(MetadataFields, AreThoseOfTheGroupsThatAreWanted)
{
    using namespace std::string_literals;
    const std::string path = written(ContainerBuilder("RIFF")
                                         .format()
                                         .chunk("LIST", "INFOINAM\5\0\0\0Rain\0\0IART\3\0\0\0\xC9"s + "a\0\0"s)
                                         .chunk("axml", "<ebuCoreMain/>")
                                         .chunk("mine", "ab")
                                         .chunk("data", 4)
                                         .bytes());
    const auto all = read(path);
    ASSERT_TRUE(all) << error.description;
    EXPECT_EQ(fourCCText(all->container), "RIFF");
    EXPECT_EQ(valueOf(*all, "info.INAM"), "Rain");
    EXPECT_EQ(valueOf(*all, "info.IART"), "\xC3\x89"
                                          "a")
        << "which was Latin-1";
    EXPECT_EQ(valueOf(*all, "mine"), "6162");
    EXPECT_EQ(all->fields.front().chunk, fourCC("LIST"));

    CAudioFileIO file;
    EXPECT_FALSE(ReadMetadataFieldsOfOpenFile(file, {}, &error)) << "not open";
    ASSERT_EQ(file.Open(CFileRef(path.c_str(), false), 0), kStatusOK);
    const auto ofOpen = ReadMetadataFieldsOfOpenFile(file, {"mine"}, &error);
    ASSERT_TRUE(ofOpen) << error.description;
    EXPECT_EQ(valueOf(*ofOpen, "mine"), "6162");
    EXPECT_EQ(ofOpen->fields.size(), 1u);

    const auto some = read(path, {"INFO"});
    ASSERT_TRUE(some);
    EXPECT_EQ(some->fields.size(), 2u) << "whatever the case of the name";
    const auto held = HoldMetadata(CFileRef(path.c_str(), false), {"mine"}, &error);
    ASSERT_TRUE(held);
    EXPECT_EQ(held->source.chunks.size(), 1u) << "others are not read";
    EXPECT_EQ(MetadataFieldsOf(*held).size(), 1u);
    const auto groups = MetadataGroupNames();
    for (const char* name : {"info", "bext", "id3v2", "mark"})
        EXPECT_TRUE(std::ranges::find(groups, name) != groups.end()) << name;
}

TEST_F(MetadataFields, OfWhatCannotBeReadThereAreNone)
{
    const auto is = [&](MetadataError code) {
        return error.domain == kMetadataErrorDomain && error.code == static_cast<std::int64_t>(code);
    };
    EXPECT_FALSE(read(folder / "missing"));
    EXPECT_EQ(NSErrorToOSErr(&error), kStatusFileNotFound);
    EXPECT_FALSE(read(folder.write("text", "no sound at all, whoever looks")));
    EXPECT_TRUE(is(MetadataError::noAudio)) << error.description;
    EXPECT_FALSE(HoldMetadata(CFileRef((folder / "text").c_str(), false), {}, &error));
    EXPECT_TRUE(is(MetadataError::noChunks)) << error.description;
}
