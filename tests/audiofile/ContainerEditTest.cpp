// Edits of containers with checks before and after: objections, and that nothing else is lost.
#include "audiofile/CContainerEdit.h"
#include "audiofile/ChunkSurvey.h"
#include "audiofile/ContainerChanges.h"

#include "support/ContainerBuilder.h"
#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

namespace {

constexpr FourCC kNote = fourCC("note");

ContainerBuilder wave()
{
    return ContainerBuilder("RIFF").format().chunk("data", "1234").chunk("keep", "kept");
}

ContainerBuilder caf(std::optional<std::int64_t> dataSize = {})
{
    return ContainerBuilder("caff").format().chunk("keep", "kept").chunk("data", "edit1234", dataSize);
}

CFileRef at(const std::string& path)
{
    return CFileRef(path.c_str(), false);
}

std::int32_t addNote(const std::string& path)
{
    return AddChunkTo(at(path), {.id = kNote, .body = bytesOf("text")}).Status();
}

/// Overwrites bytes in the file.
void poke(const std::string& path, std::int64_t position, std::string_view bytes)
{
    CFileIO file;
    ASSERT_EQ(file.OpenReadWrite(at(path), 0), kStatusOK);
    ASSERT_EQ(file.Write(bytes.data(), position, std::ssize(bytes)), kStatusOK);
}

struct ContainerEdit : testing::Test {
    TemporaryFolder folder;

    std::size_t files() const
    {
        return static_cast<std::size_t>(std::distance(std::filesystem::directory_iterator(folder.path()), {}));
    }
};

} // namespace

TEST_F(ContainerEdit, EveryObjection)
{
    using Kind = ChunkObjection::Kind;
    using Fault = ContainerTail::Fault;
    Bytes stray = wave().bytes();
    stray.resize(stray.size() + 31);
    const struct {
        const char* what;
        Bytes image;
        FourCC id;
        Kind adding, removing;
        Fault fault = Fault::none;
    } cases[] = {
        {"nothing", wave().bytes(), kNote, Kind::none, Kind::none},
        {"WAVE format", wave().bytes(), fourCC("fmt "), Kind::oneOnly, Kind::soundLost},
        {"WAVE text", wave().bytes(), fourCC("keep"), Kind::none, Kind::none},
        {"AIFF sound", ContainerBuilder("FORM", "AIFF").format(2).chunk("SSND", 12).bytes(), fourCC("SSND"),
         Kind::oneOnly, Kind::soundLost},
        {"a WAVE chunk's id in AIFF", ContainerBuilder("FORM", "AIFF").format().chunk("data", 12).bytes(),
         fourCC("data"), Kind::none, Kind::none},
        {"CAF description", caf().bytes(), fourCC("desc"), Kind::oneOnly, Kind::soundLost},
        {"open-ended CAF", caf(-1).bytes(), kNote, Kind::none, Kind::none},
        {"CAF cut short", caf(999).bytes(), kNote, Kind::tail, Kind::none, Fault::cutShort},
        {"uncounted bytes", stray, kNote, Kind::tail, Kind::none, Fault::stray},
        {"empty container", ContainerBuilder("caff").bytes(), kNote, Kind::tail, Kind::none, Fault::noChunk},
        {"no id", ContainerBuilder("RIFF").format().chunk("\1\2\3\4", "", 99).bytes(), kNote, Kind::tail, Kind::none,
         Fault::noId},
    };
    for (const auto& each : cases) {
        SCOPED_TRACE(each.what);
        MemoryAudioFile file(each.image);
        ChunkSurvey survey;
        ChunkObjection objection;
        ASSERT_FALSE(SurveyChunks(file, each.id, survey));
        ASSERT_FALSE(ObjectToAdding(file, survey, each.id, objection));
        EXPECT_EQ(objection.kind, each.adding);
        EXPECT_EQ(objection.tail.fault, each.fault);
        EXPECT_EQ(ObjectionToRemoving(survey, each.id).kind, each.removing);
    }
    MemoryAudioFile nothing{Bytes(100)};
    ChunkSurvey survey;
    EXPECT_EQ(SurveyChunks(nothing, kNote, survey).kind, ContainerProblem::Kind::chunks);
}

TEST_F(ContainerEdit, ASurveyFindsWhatTheLibraryAnswersWith)
{
    for (const auto& [container, found] : {std::pair("RIFF", 2), std::pair("caff", 1)}) {
        ContainerBuilder builder(container);
        MemoryAudioFile file(builder.format().chunk("note", "").chunk("note", "1").chunk("note", "22").bytes());
        ChunkSurvey survey;
        ASSERT_FALSE(SurveyChunks(file, kNote, survey));
        EXPECT_EQ(std::pair(survey.count, survey.total), std::pair(std::int64_t{3}, std::int64_t{3}));
        EXPECT_EQ(survey.found->size, found);
        ChunkEntry located;
        EXPECT_EQ(file.LocateChunk(kNote, located), 1);
        EXPECT_EQ(located.offset, survey.found->offset);
        EXPECT_EQ(survey.last->size, 2);
    }
}

TEST_F(ContainerEdit, AnOpenEndIsSettledFirst)
{
    const std::string path = folder.write("a.caf", caf(-1).bytes());
    EXPECT_EQ(addNote(path), kStatusOK);
    EXPECT_EQ(readFile(path), caf().chunk("note", "text").bytes());
    folder.write("a.caf", caf(-1).bytes());
    EXPECT_FALSE(SettleContainerEnd(at(path)));
    EXPECT_EQ(readFile(path), caf().bytes());
    folder.write("a.caf", caf(999).bytes());
    EXPECT_EQ(SettleContainerEnd(at(path)).Status(), kStatusParameterError);
    EXPECT_EQ(AddChunkTo(at(path), {.id = kNote}).Status(), kStatusParameterError);
    EXPECT_EQ(readFile(path), caf(999).bytes());
    EXPECT_EQ(SettleContainerEnd(at(folder.write("empty", ""))).kind, ContainerProblem::Kind::empty);
    EXPECT_EQ(SettleContainerEnd(at(folder.write("text", "no container"))).kind, ContainerProblem::Kind::noContainer);
}

TEST_F(ContainerEdit, EveryChunkOfAnIdIsReplacedOrRemoved)
{
    for (const auto& plain : {wave(), caf()}) {
        const auto with = [&plain](std::initializer_list<std::string_view> notes) {
            ContainerBuilder builder = plain;
            for (const std::string_view note : notes)
                builder.chunk("note", note);
            return builder.bytes();
        };
        const std::string path = folder.write("a", with({"1", "22", "333"}));
        EXPECT_EQ(RemoveChunksFrom(at(path), kNote, 2).kind, ContainerProblem::Kind::chunks);
        EXPECT_FALSE(AddChunkTo(at(path), {.id = kNote, .body = bytesOf("text"), .replaces = true}));
        EXPECT_TRUE(readFile(path) == with({"text"}));
        EXPECT_FALSE(RemoveChunksFrom(at(path), kNote, 1));
        EXPECT_TRUE(readFile(path) == with({}));
    }
    // Kept: an empty chunk of a CAF file is not removed.
    const std::string path = folder.write("a", ContainerBuilder(caf()).chunk("note", "").bytes());
    EXPECT_EQ(RemoveChunksFrom(at(path), kNote, 1).kind, ContainerProblem::Kind::notRemoved);
}

TEST_F(ContainerEdit, WhatIsNotInTheScopeIsThereAfterwards)
{
    using Kind = ContainerProblem::Kind;
    const Bytes image = wave().bytes();
    const auto position = static_cast<std::int64_t>(textOf(image).find("kept"));
    const struct {
        const char* what;
        std::function<void(const std::string&)> harm;
        Kind kind;
        FourCC id = 0;
    } cases[] = {
        {"a byte", [&](const std::string& path) { poke(path, position + 3, "x"); }, Kind::changed, fourCC("keep")},
        {"a name", [&](const std::string& path) { poke(path, position - 8, "Keep"); }, Kind::changed, fourCC("keep")},
        {"a chunk gone", [&](const std::string& path) { (void)RemoveChunksFrom(at(path), fourCC("keep"), 1); },
         Kind::changed, fourCC("keep")},
        {"a chunk too many", [&](const std::string& path) { (void)AddChunkTo(at(path), {.id = fourCC("more")}); },
         Kind::changed, fourCC("more")},
        {"an end too many",
         [&](const std::string& path) { std::filesystem::resize_file(path, std::filesystem::file_size(path) + 9); },
         Kind::tailChanged},
        {"its own chunk cut",
         [&](const std::string& path) { std::filesystem::resize_file(path, std::filesystem::file_size(path) - 1); },
         Kind::cutShort},
        {"the container", [&](const std::string& path) { poke(path, 0, "none"); }, Kind::noContainer},
    };
    for (const bool inPlace : {false, true})
        for (const auto& each : cases) {
            SCOPED_TRACE(each.what);
            const std::string path = folder.write("a.wav", image);
            CContainerEdit edit;
            ASSERT_FALSE(edit.Begin(path, {.inPlace = inPlace}));
            const FileProblem problem = edit.Apply(EditScope::chunk(kNote), [&](const std::string& copy) {
                EXPECT_EQ(addNote(copy), kStatusOK);
                each.harm(copy);
                return kStatusOK;
            });
            EXPECT_EQ(problem.kind, FileProblem::Kind::refused);
            EXPECT_EQ(edit.Difference().kind, each.kind);
            EXPECT_EQ(edit.Difference().id, each.id);
            EXPECT_EQ(readFile(path) == image, !inPlace);
            EXPECT_EQ(files(), 1u);
        }
}

TEST_F(ContainerEdit, AnEditThatFailsInPlaceLeavesNoTail)
{
    for (const auto& image : {wave().bytes(), caf().bytes()}) {
        const std::string path = folder.write("a", image);
        CContainerEdit edit;
        ASSERT_FALSE(edit.Begin(path, {.inPlace = true}));
        EXPECT_EQ(edit.Apply(EditScope::chunk(kNote),
                             [](const std::string& file) {
                                 std::filesystem::resize_file(file, std::filesystem::file_size(file) + 9);
                                 return kStatusDiskFull;
                             })
                      .Status(),
                  kStatusDiskFull);
        EXPECT_EQ(readFile(path), image);
    }
}

TEST_F(ContainerEdit, AFailedCallLeavesTheOldFileOrTheNewOne)
{
    int failures = 0;
    for (const auto& plain : {wave(), caf()}) {
        ContainerBuilder builder = plain;
        const Bytes before = builder.bytes(), after = builder.chunk("note", "text").bytes();
        const std::string path = folder / "a";
        for (const Call call : {Call::pread, Call::pwrite, Call::ftruncate, Call::fsync, Call::close})
            for (int nth = 1, calls = 1; calls >= nth - 1; ++nth) { // one more than there are
                SCOPED_TRACE(testing::Message() << static_cast<int>(call) << " " << nth);
                folder.write("a", before);
                FileProblem problem;
                {
                    FaultInjector faults;
                    faults.fail(call, EIO, nth);
                    CContainerEdit edit;
                    problem = edit.Begin(path);
                    if (!problem)
                        problem = edit.Apply(EditScope::chunk(kNote), addNote);
                    calls = faults.calls(call);
                    EXPECT_NE(edit.Difference().kind, ContainerProblem::Kind::changed)
                        << "what cannot be read is told so";
                }
                const bool isThere = !problem || problem.kind == FileProblem::Kind::uncommitted;
                EXPECT_EQ(readFile(path), isThere ? after : before);
                EXPECT_EQ(files(), 1u);
                failures += problem ? 1 : 0;
            }
    }
    EXPECT_GT(failures, 20);
}
