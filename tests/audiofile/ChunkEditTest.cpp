// Adding and removing chunks, and the headers that follow the samples.
#include "audiofile/CAudioFileIO.h"
#include "audiofile/ContainerTail.h"

#include "support/ContainerBuilder.h"
#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <chrono>
#include <fstream>

using namespace std::string_view_literals;

namespace {

std::int32_t add(CAudioFileIO& file, const char (&id)[5], std::string_view body, bool replace = false)
{
    return file.AddChunk(fourCC(id), bytesOf(body), replace);
}

ContainerBuilder wave()
{
    return ContainerBuilder("RIFF").format().chunk("data", "1234");
}

ContainerBuilder aiff()
{
    return ContainerBuilder("FORM", "AIFF").format(2).chunk("SSND", 12);
}

TEST(ChunkEdit, AnAddedChunkStandsBehindTheLast)
{
    const auto withBehind = [](Bytes image, std::string_view behind) {
        image.insert(image.end(), bytesOf(behind).begin(), bytesOf(behind).end());
        return image;
    };
    const struct {
        const char* what;
        Bytes before, after;
        std::string_view body;
    } cases[] = {
        {"WAVE", wave().bytes(), wave().chunk("note", "odd").bytes(), "odd"},
        {"nothing", aiff().bytes(), aiff().chunk("note", "").bytes(), ""},
        {"last size stale", wave().chunk("LIST", "abcdef", 2).bytes(),
         wave().chunk("LIST", "abcdef").chunk("note", "x").bytes(), "x"},
        {"file cut short", wave().bytes(4000), wave().chunk("note", "x").bytes(), "x"},
        {"CAF data to the end", ContainerBuilder("caff").format().chunk("data", "1234", -1).bytes(),
         ContainerBuilder("caff").format().chunk("data", "1234", -1).chunk("note", "x").bytes(), "x"},
        {"over what follows the container", withBehind(wave().bytes(), "behind the container"),
         withBehind(wave().chunk("note", "12").bytes(), " container"), "12"},
    };
    for (const auto& each : cases) {
        SCOPED_TRACE(each.what);
        MemoryAudioFile file(each.before);
        EXPECT_EQ(file.AddChunk(fourCC("note"), bytesOf(each.body), false), 1);
        EXPECT_EQ(textOf(contentOf(file)), textOf(each.after));
        EXPECT_EQ(file.Info().fileLength, file.GetEOF());
    }
}

/// Values from opening are trusted only where a later change would show. Here another program has restored the
/// container's size from before its last chunk, which keeps the file's length.
TEST(ChunkEdit, AddingGoesByWhatOpeningReadOnlyWhereChangesShow)
{
    static std::int64_t stamp;
    const std::int64_t now = std::chrono::nanoseconds(std::chrono::system_clock::now().time_since_epoch()).count();
    const std::int64_t longAgo = now - 3'600'000'000'000;
    const Bytes before = wave().chunk("old ", "12").bytes(), shrunk = wave().bytes();
    const struct {
        const char* what;
        std::int64_t atOpen, atAdding;
        bool isShrunk, isRead;
    } cases[] = {{"unchanged", longAgo, longAgo, false, false},
                 {"changed since", longAgo, now, true, true},
                 {"changed within the tick of the change before", now, now, true, true},
                 {"a clock that is ahead", now + 3'600'000'000'000, now + 3'600'000'000'000, true, true}};
    const TemporaryFolder folder;
    for (const auto& each : cases) {
        SCOPED_TRACE(each.what);
        FaultInjector calls;
        static const platform::SystemCalls intercepted = platform::systemCalls();
        platform::systemCalls().openFileWithoutLinks = [](const char*, platform::OpenFor, platform::FileStatus*) {
            errno = ENOSYS;
            return -1;
        };
        platform::systemCalls().openFile = [](const char* path, platform::OpenFor access,
                                              platform::FileStatus* status) {
            platform::FileStatus found;
            const int descriptor = intercepted.openFile(path, access, &found);
            found.changed = stamp;
            if (status != nullptr)
                *status = found;
            return descriptor;
        };
        platform::systemCalls().status = [](int descriptor, platform::FileStatus* status) {
            const bool result = intercepted.status(descriptor, status);
            status->changed = stamp;
            return result;
        };
        const std::string path = folder.write("a.wav", before);
        stamp = each.atOpen;
        CAudioFileIO file(CFileRef(path.c_str(), false), kFileIOReadWrite);
        if (each.isShrunk)
            std::fstream(path, std::ios::in | std::ios::out | std::ios::binary)
                .write(reinterpret_cast<const char*>(shrunk.data()), 8);
        stamp = each.atAdding;
        const int reads = calls.calls(Call::pread);
        EXPECT_EQ(add(file, "note", "abcd"), 1);
        EXPECT_EQ(calls.calls(Call::pread) > reads, each.isRead);
        EXPECT_EQ(add(file, "next", "ef"), 1); // by what the file is now, whatever its stamp says
        file.Close();
        EXPECT_EQ(textOf(readFile(path)), textOf((each.isShrunk ? wave() : wave().chunk("old ", "12"))
                                                     .chunk("note", "abcd")
                                                     .chunk("next", "ef")
                                                     .bytes()));
    }
}

TEST(ChunkEdit, Remove)
{
    const auto ahead = [](const char* id) {
        return ContainerBuilder("RIFF").format().chunk(id, "odd").chunk("data", "1234");
    };
    struct Case {
        const char* what;
        FourCC id;
        Bytes before, after;
        std::int64_t dataOffset;
    };
    const FourCC note = fourCC("note");
    const Case cases[] = {
        {"behind", note, wave().chunk("note", "odd").chunk("LIST", "x").bytes(), wave().chunk("LIST", "x").bytes(), 44},
        {"ahead", note, ahead("note").bytes(), ahead("free").bytes(), 56},
        {"ahead and behind", note, ahead("note").chunk("note", "").chunk("LIST", "").chunk("note", "12").bytes(),
         ahead("free").chunk("LIST", "").bytes(), 56},
        {"filler ahead", kFree, ahead("free").bytes(), wave().bytes(), 44},
        {"not all there", note, wave().chunk("note", "12").chunk("note", "34", 5).bytes(),
         wave().chunk("note", "12").chunk("note", "34", 5).bytes(), 44},
        {"the first, with nothing ahead of it", kJUNK,
         ContainerBuilder("RIFF").chunk("JUNK", 28).chunk("LIST", "12").bytes(),
         ContainerBuilder("RIFF").chunk("LIST", "12").bytes(), 0},
        {"CAF", note,
         ContainerBuilder("caff")
             .format()
             .chunk("note", "1")
             .chunk("data", "abcdef")
             .chunk("note", "2")
             .chunk("note", "3")
             .bytes(),
         ContainerBuilder("caff").format().chunk("free", "1").chunk("data", "abcdef").chunk("note", "3").bytes(), 81},
        {"no container", note, Bytes(40), Bytes(40), 0},
    };
    for (const Case& each : cases) {
        SCOPED_TRACE(each.what);
        MemoryAudioFile file(each.before);
        EXPECT_EQ(file.RemoveChunk(each.id), 0);
        EXPECT_EQ(textOf(contentOf(file)), textOf(each.after));
        EXPECT_EQ(file.Info().dataOffset, each.dataOffset);
    }
}

TEST(ChunkEdit, ManyOfAnIdAreRemovedInLinearTime)
{
    constexpr int count = 120'000; // more than is moved at a time
    for (ContainerBuilder builder : {wave(), ContainerBuilder("caff").format().chunk("data", "1234")}) {
        ContainerBuilder left = builder;
        for (int i = 0; i < count; ++i) {
            const std::string text = std::to_string(i);
            builder.chunk("note", "1").chunk("LIST", text);
            left.chunk("LIST", text);
        }
        const TemporaryFolder folder;
        const std::string path = folder.write("many", builder.bytes());
        CAudioFileIO file(CFileRef(path.c_str(), false), kFileIOReadWrite);
        FaultInjector faults;
        EXPECT_EQ(file.RemoveAllChunks(fourCC("note")), 0);
        EXPECT_LE(faults.calls(Call::pread) + faults.calls(Call::pwrite), count / 10);
        EXPECT_EQ(faults.calls(Call::ftruncate), 1);
        file.Close();
        EXPECT_TRUE(readFile(path) == left.bytes());
    }
}

TEST(ChunkEdit, AllAtOnceLeaveWhatOneByOneLeave)
{
    const auto caf = [] { return ContainerBuilder("caff").format(); };
    const Bytes cases[] = {caf().chunk("note", "1").chunk("note", "22").chunk("data", "abcdef").bytes(),
                           caf().chunk("data", "ab").chunk("note", "1").chunk("note", "").chunk("note", "333").bytes(),
                           caf().chunk("note", "1").chunk("data", "ab").chunk("note", "2").chunk("x   ", "3").bytes(),
                           caf().chunk("data", "ab").chunk("note", "1").chunk("note", "22", 5).bytes(),
                           wave().chunk("note", "odd").chunk("LIST", "x").chunk("note", "").bytes()};
    for (const Bytes& before : cases) {
        MemoryAudioFile atOnce(before), oneByOne(before);
        EXPECT_EQ(atOnce.RemoveAllChunks(fourCC("note")), 0);
        for (int i = 0; i < 5; ++i)
            EXPECT_EQ(oneByOne.RemoveChunk(fourCC("note")), 0);
        EXPECT_EQ(textOf(contentOf(atOnce)), textOf(contentOf(oneByOne)));
    }
}

TEST(ChunkEdit, FailuresSayWhatWasNotWritten)
{
    const TemporaryFolder folder;
    const auto open = [&](CAudioFileIO& file, const Bytes& content) {
        return file.Open(CFileRef(folder.write("a", content).c_str(), false), kFileIOReadWrite);
    };
    struct Case {
        const char* what;
        Bytes content;
        int write; // which one fails
        int times; // and how many from there on
        std::int32_t result;
    };
    const Case cases[] = {
        {"chunk header", wave().bytes(), 1, 2, -3},
        {"body", wave().bytes(), 1, 1, -4}, // its header, tried alone, can be written
        {"container", wave().bytes(), 2, 1, -5},
        {"last chunk", wave().chunk("LIST", "abcdef", 2).bytes(), 1, 1, -5},
        {"CAF", ContainerBuilder("caff").format().bytes(), 1, 1, -3},
        {"renaming", ContainerBuilder("RIFF").format().chunk("note", "1").chunk("data", "1234").bytes(), 1, 1, -7},
    };
    for (const Case& each : cases) {
        SCOPED_TRACE(each.what);
        CAudioFileIO file;
        open(file, each.content);
        FaultInjector faults;
        faults.fail(Call::pwrite, ENOSPC, each.write, each.times);
        EXPECT_EQ(add(file, "note", "odd", true), each.result);
    }
    CAudioFileIO file;
    EXPECT_EQ(add(file, "note", "x"), -6);
    open(file, Bytes(40));
    EXPECT_EQ(add(file, "note", "x"), 0);
    EXPECT_EQ(file.AddChunk(fourCC("note"), nullptr, 1, false), kStatusParameterError);
    EXPECT_EQ(file.AddChunk(fourCC("note"), nullptr, -1, false), kStatusParameterError);
    open(file, Bytes(4));
    EXPECT_EQ(file.RemoveChunk(kData), -2);
    open(file, ContainerBuilder("FORM", "AIFF").chunk("COMM", "").bytes(0x80000000));
    EXPECT_EQ(add(file, "note", "x"), kStatusEndOfFile); // a negative size ends ahead of the file
    file.Open(CFileRef(folder.write("b", wave().chunk("note", "").bytes()).c_str(), false), 0);
    EXPECT_EQ(add(file, "note", "x"), -6);
    EXPECT_EQ(file.RemoveChunk(fourCC("note")), kStatusNotOpen);
}

TEST(ChunkEdit, NothingOfAFileIsKnownWhenAnotherIsOpen)
{
    const TemporaryFolder folder;
    const CFileRef one((folder / "one.wav").c_str(), false);
    const CFileRef two(folder.write("two.aif", aiff().bytes()).c_str(), false);
    const float sample = 0.5;
    const struct {
        const char* what;
        void (*open)(CFileIO& file, const CFileRef& other);
    } roads[] = {
        {"OpenReadWrite", [](CFileIO& file, const CFileRef& other) { file.OpenReadWrite(other, 0); }},
        {"OpenRead", [](CFileIO& file, const CFileRef& other) { file.OpenRead(other, 0); }},
        {"Open", [](CFileIO& file, const CFileRef& other) { file.Open(other, kFileIOReadWrite); }},
        {"Init", [](CFileIO& file, const CFileRef& other) { file.Init(), file.CFileIO::Open(other, 1); }},
        {"Close", [](CFileIO& file, const CFileRef& other) { file.Close(), file.Open(other, 1); }},
    };
    for (const auto& road : roads) {
        SCOPED_TRACE(road.what);
        CAudioFileIO file;
        ASSERT_EQ(file.CreateAndOpenCommon(one, 0, kAudioBusMono, 0, 16, 44100, kWAVE, false), kStatusOK);
        ASSERT_EQ(file.WriteFrames(&sample, 0, 1), kStatusOK);
        road.open(file, two);
        EXPECT_TRUE(file.IsOpen());
        EXPECT_NE(file.Info().fileType, kWAVE);
        EXPECT_EQ(file.Close(), kStatusOK);
        EXPECT_EQ(readFile(folder / "two.aif"), aiff().bytes());
    }
}

TEST(ChunkEdit, WhatIsStillInTheWriteCacheIsPartOfTheFile)
{
    const TemporaryFolder folder;
    CAudioFileIO file(CFileRef(folder.write("a.wav", wave().bytes()).c_str(), false), kFileIOReadWrite);
    file.SetWCache(4096);
    file.SetMark(44);
    ASSERT_EQ(file.Write("5678", 4), kStatusOK);
    EXPECT_EQ(add(file, "note", "12"), 1);
    EXPECT_EQ(readFile(folder / "a.wav"),
              ContainerBuilder("RIFF").format().chunk("data", "5678").chunk("note", "12").bytes());
    file.SetMark(44);
    ASSERT_EQ(file.Write("abcd", 4), kStatusOK);
    EXPECT_EQ(file.RemoveChunk(fourCC("note")), 0);
    EXPECT_EQ(readFile(folder / "a.wav"), ContainerBuilder("RIFF").format().chunk("data", "abcd").bytes());
}

TEST(ChunkEdit, OnlyAHeaderOfOursIsBuiltAnew)
{
    const TemporaryFolder folder;
    const auto sowt =
        ContainerBuilder("FORM", "AIFC").chunk("COMM", "\0\1\0\0\0\2\0\20\x40\x0E\xAC\x44\0\0\0\0\0\0sowt\0\0"sv);
    const struct {
        const char* what;
        Bytes content;
    } foreign[] = {
        {"24 bits in a plain format",
         ContainerBuilder("RIFF").chunk("fmt ", waveFormat(1, 1, 44100, 3, 24)).chunk("data", "abcdef").bytes()},
        {"sowt", ContainerBuilder(sowt).chunk("SSND", "12345678abcd").bytes()},
        {"LIST ahead of the samples",
         ContainerBuilder("RIFF").format().chunk("LIST", "text").chunk("data", "1234").bytes()},
        {"LIST as long as the reservation",
         ContainerBuilder("RIFF").chunk("LIST", std::string(28, 't')).format().chunk("data", "1234").bytes()},
    };
    for (const auto& each : foreign) {
        SCOPED_TRACE(each.what);
        CAudioFileIO file(CFileRef(folder.write("a", each.content).c_str(), false), kFileIOReadWrite);
        EXPECT_EQ(file.SetNumFrames(1), kStatusParameterError);
        EXPECT_EQ(file.Close(), kStatusOK);
        EXPECT_EQ(readFile(folder / "a"), each.content);
    }
    // Samples count despite a header that was never filled in.
    const CFileRef ref((folder / "new.wav").c_str(), false);
    CAudioFileIO file;
    ASSERT_EQ(file.CreateAndOpenCommon(ref, 0, kAudioBusMono, 0, 8, 44100, kWAVE, false), kStatusOK);
    ASSERT_EQ(file.Write("abcde", 44, 5), kStatusOK);
    ASSERT_EQ(file.Close(), kStatusOK);
    ASSERT_EQ(file.Open(ref, kFileIOReadWrite), kStatusOK);
    EXPECT_EQ(file.SetNumFrames(3), kStatusOK);
    EXPECT_EQ(file.GetEOF(), 47);
    EXPECT_EQ(file.Close(), kStatusOK);
    EXPECT_EQ(readFile(folder / "new.wav").size(), 48u) << "the pad byte";
}

TEST(ChunkEdit, ASizeThatIsNoneHidesNothingAfterARemoval)
{
    const Bytes content =
        ContainerBuilder("FORM", "AIFF").chunk("note", "x").format(2).chunk("SSND", 12).bytes(0x80000010);
    MemoryAudioFile file(content);
    EXPECT_EQ(file.RemoveChunk(fourCC("note")), 0);
    const Bytes removed(contentOf(file).begin(), contentOf(file).end());
    EXPECT_EQ(add(file, "new ", "y"), kStatusEndOfFile); // refused, not put over the samples
    EXPECT_EQ(textOf(contentOf(file)), textOf(removed));
}

TEST(ChunkEdit, TheEndIsPreparedWhereThatCostsNothing)
{
    const auto caf = [](std::optional<std::int64_t> size = {}) {
        return ContainerBuilder("caff").format().chunk("data", "1234abc", size).bytes();
    };
    const auto with = [](Bytes image, std::string_view behind) {
        image.insert(image.end(), bytesOf(behind).begin(), bytesOf(behind).end());
        return image;
    };
    const auto odd = ContainerBuilder("RIFF").format().unpadded("data", "123");
    // Samples after a size that was never filled in, mistaken for chunks.
    const auto open = ContainerBuilder("RIFF").format().chunk("data", "").chunk("\1\2\3\4", "5678", 0x05060708).bytes();
    const struct {
        const char* what;
        Bytes before, after;
        std::int32_t status = 0;
    } cases[] = {
        {"nothing to do", wave().bytes(), wave().bytes()},
        {"no pad byte", odd.bytes(), with(odd.bytes(), "\0"sv)},
        {"less than a header", with(wave().bytes(4000), "stray12"), wave().bytes(4000)},
        {"more than a header", with(wave().bytes(), "stray123"), with(wave().bytes(), "stray123"),
         kStatusParameterError},
        {"no chunk at all", open, open, kStatusParameterError},
        {"room that was not finished", with(wave().bytes(), "free\x04\0\0\0"sv), wave().bytes()},
        {"room that was not counted", with(wave().bytes(), "free\x04\0\0\0\0\0\0\0"sv), wave().bytes()},
        {"no room", with(wave().bytes(), "free\x04\0\0\0\0\0\0x"sv), with(wave().bytes(), "free\x04\0\0\0\0\0\0x"sv),
         kStatusParameterError},
        {"CAF, room that was not finished", with(caf(), "free\0\0\0\0\0\0\0\x09"sv), caf()},
        {"CAF, to the end", caf(-1), caf()},
        {"CAF, a pad byte", with(caf(), "\0"sv), caf()},
        {"CAF, a header", with(caf(), "123456789012"), with(caf(), "123456789012"), kStatusParameterError},
        {"CAF, unfinished", caf(0), caf(0), kStatusParameterError},
        {"CAF, cut short", caf(100), caf(100), kStatusParameterError},
        {"CAF, a size far below zero", caf(INT64_MIN + 1000), caf(INT64_MIN + 1000), kStatusParameterError},
    };
    for (const auto& each : cases) {
        SCOPED_TRACE(each.what);
        MemoryAudioFile file(each.before);
        ContainerTail tail;
        EXPECT_EQ(ExamineContainerTail(file, tail), kStatusOK);
        EXPECT_EQ(tail.fault == ContainerTail::Fault::none, each.status == kStatusOK);
        EXPECT_EQ(textOf(contentOf(file)), textOf(each.before));
        EXPECT_EQ(file.PrepareToAppend(), each.status);
        EXPECT_EQ(textOf(contentOf(file)), textOf(each.after));
        if (each.status != kStatusOK)
            continue;
        EXPECT_EQ(add(file, "note", "x"), 1);
        ChunkEntry data, note;
        EXPECT_EQ(file.LocateChunk(kData, data), 1);
        EXPECT_EQ(file.LocateChunk(fourCC("note"), note), 1);
        EXPECT_EQ(note.offset, std::ssize(each.after));
    }
    MemoryAudioFile reader(wave().bytes(), 0);
    EXPECT_EQ(reader.PrepareToAppend(), kStatusWritePermission);
}

TEST(ChunkEdit, TheHeaderFollowsTheSamples)
{
    const TemporaryFolder folder;
    const CFileRef ref((folder / "new").c_str(), false);
    const float samples[] = {0, 0.5, -0.5};
    for (const FourCC type : {kWAVE, kAIFF, kCaff}) {
        SCOPED_TRACE(fourCCText(type));
        CAudioFileIO file;
        ASSERT_EQ(file.CreateAndOpenCommon(ref, 100, kAudioBusMono, 0, 8, 44100, type, true), kStatusOK);
        EXPECT_EQ(file.CacheBlock()->size(), 102400u);
        EXPECT_EQ(file.Info().frames, 0);
        EXPECT_EQ(file.WriteFrames(samples, 0, 3), kStatusOK);
        EXPECT_EQ(add(file, "note", "x"), 1); // behind samples that the header on disk does not count yet
        CAudioFileIO another(ref, 0);         // another reader finds the file complete already
        EXPECT_EQ(another.Info().frames, 3);
        EXPECT_EQ(another.FindChunk(fourCC("note")), Bytes(1, std::byte{'x'}));
        EXPECT_EQ(file.Close(), kStatusOK);
        ASSERT_EQ(file.Open(ref, kFileIOReadWrite), kStatusOK);
        EXPECT_EQ(file.Info().frames, 3);
        EXPECT_EQ(file.FindChunk(fourCC("note")), Bytes(1, std::byte{'x'}));
        const std::int64_t dataOffset = file.Info().dataOffset;
        EXPECT_EQ(file.SetNumFrames(2), kStatusOK);
        EXPECT_EQ(file.Info().dataOffset, dataOffset); // the reservation is still there, the samples where they were
        EXPECT_EQ(file.GetEOF(), dataOffset + 2);
        EXPECT_EQ(file.SetNumFrames(-1), kStatusParameterError);
    }
    CAudioFileIO file;
    ASSERT_EQ(file.CreateAndOpenCommon(ref, 0, kAudioBusMono, 0, 8, 44100, kWAVE, false), kStatusOK);
    file.WriteFrames(samples, 0, 3);
    EXPECT_EQ(file.UpdateHeader(), kStatusOK);
    EXPECT_EQ(file.GetEOF(), 48); // 44 and 3, padded
    EXPECT_EQ(file.CreateAndOpenCommon(ref, 0, kAudioBusMono, 0, 7, 44100, kWAVE, false), kStatusParameterError);
    EXPECT_EQ(readFile(folder / "new").size(), 48u); // which left the file alone
    MemoryAudioFile other(Bytes(100));
    EXPECT_EQ(other.SetNumFrames(0), kStatusParameterError); // no header to build: nothing is cut off
    EXPECT_EQ(other.GetEOF(), 100);
}

} // namespace
