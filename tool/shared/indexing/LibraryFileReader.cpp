#include "tool/shared/indexing/LibraryFileReader.h"

#include "audiofile/fields/FileMetadata.h"
#include "loops/tags/LoopTags.h"
#include "platform/core/Status.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/description/FileDescription.h"
#include "tool/shared/description/FoundProblems.h"
#include "tool/shared/indexing/BoundedText.h"
#include "tool/shared/indexing/FieldTexts.h"
#include "tool/shared/indexing/LoopTagColumns.h"
#include "tool/shared/indexing/SoundColumns.h"
#include "tool/shared/indexing/SoundPass.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/input/FoundFile.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

#include <ctime>
#include <sys/stat.h>

namespace {

constexpr double kLongestWait = 2;           // in seconds, for other programs
constexpr int kMostReadings = 3;             // of a file that changes while it is read
constexpr std::size_t kMostProblems = 1000;  // of a file
constexpr std::size_t kMostOfProblem = 1024; // bytes of a text

std::int64_t inNanoseconds(const timespec& time)
{
    return std::int64_t{time.tv_sec} * 1'000'000'000 + time.tv_nsec;
}

/// None for a file that is not there.
std::optional<SeenStamp> stampOf(const std::string& path)
{
    struct stat status = {};
    if (::stat(path.c_str(), &status) != 0)
        return std::nullopt;
    return SeenStamp{status.st_size, inNanoseconds(status.st_mtim), inNanoseconds(status.st_ctim),
                     static_cast<std::int64_t>(status.st_ino)};
}

// Reads one file once.
class LibraryFileReading {
public:
    LibraryFileReading(const FilePlace& place, const LibraryReading& wanted) : path_(place.path()), wanted_(wanted)
    {
        record_.place = place;
    }

    /// None for a file that is no audio and is not called audio.
    std::optional<LibraryRecord> read()
    {
        try {
            readAll();
        } catch (const OtherKind& other) {
            if (!other.isAudio() && !isCalledAudio(path_))
                return std::nullopt;
            fail("unreadable", other.what());
        } catch (const Failure& failure) {
            if (!isOpen_ && !isCalledAudio(path_))
                return std::nullopt;
            fail("unreadable", failure.what());
        }
        return std::move(record_);
    }
    bool isInUse() const { return isInUse_; }

private:
    void readAll()
    {
        FileAccess access;
        if (wanted_.waits) {
            try {
                access = accessForReading(path_, {.timeoutSeconds = kLongestWait, .quiet = true});
            } catch (const Failure& failure) {
                isInUse_ = true;
                fail("inUse", failure.what());
                return;
            }
        }
        CAudioFileIO file;
        requireOK(file.Open(referenceTo(path_), 0));
        isOpen_ = true;
        describeOpened(file, path_);
        addSound(record_, file.Info());
        addProblems(file);
        addTags(file);
        addSamples(file);
    }

    void addProblems(CAudioFileIO& file)
    {
        auto problems = problemsOfContainer(file, path_, {.comparesDigests = wanted_.hash});
        if (!problems)
            problems = problemsOfLength(file.Info());
        for (const FoundProblem& problem : *problems)
            addProblem(problem.name, problem.text);
        record_.state = record_.problems.empty() && file.Info().IsWhole() ? "whole" : "damaged";
    }

    void addTags(CAudioFileIO& file)
    {
        if (file.HasChunks())
            if (auto tags = readLoopTags(fileLocation(path_)))
                addLoopTags(record_, std::move(*tags));
        if (record_.kind.empty())
            record_.kind = "recording";
        if (const auto metadata = ReadMetadataFields(referenceTo(path_))) {
            addFieldTexts(record_, metadata->fields);
            record_.fields = fieldsJson(metadata->fields);
        }
    }

    /// A file whose sound cannot be read has neither waveform nor hash; of linear PCM, that is a problem.
    void addSamples(CAudioFileIO& file)
    {
        if (!wanted_.overview && !wanted_.hash)
            return;
        SoundPass pass = passThroughSound(file, path_, {.waveform = wanted_.overview, .hash = wanted_.hash});
        record_.overview = std::move(pass.waveform);
        record_.soundHash = std::move(pass.hash);
        if (pass.status == kStatusOK || file.Info().compressed)
            return;
        record_.state = "damaged";
        addProblem("unreadable", StatusText(pass.status));
    }

    void addProblem(const char* kind, const std::string& text)
    {
        if (record_.problems.size() < kMostProblems)
            record_.problems.push_back({kind, boundedLine(text, kMostOfProblem)});
    }

    void fail(const char* kind, const std::string& text)
    {
        record_.state = "unreadable";
        addProblem(kind, text);
    }

    const std::string path_;
    const LibraryReading wanted_;
    bool isOpen_ = false, isInUse_ = false;
    LibraryRecord record_;
};

} // namespace

std::optional<LibraryRecord> readLibraryRecord(const FilePlace& place, const SeenStamp& stamp,
                                               const LibraryReading& wanted)
{
    SeenStamp before = stamp;
    for (int reading = 1;; ++reading) {
        LibraryFileReading file(place, wanted);
        auto record = file.read();
        const auto after = stampOf(place.path());
        if (!record || !after)
            return std::nullopt;
        record->stamp = *after;
        record->indexed = std::time(nullptr);
        const bool isSettled = *after == before && !file.isInUse();
        if (!isSettled && (reading == kMostReadings || file.isInUse()))
            record->stamp.changed = record->stamp.inode = 0;
        if (isSettled || record->stamp.inode == 0)
            return record;
        before = *after;
    }
}
