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

#include <chrono>
#include <ctime>
#include <sys/stat.h>

namespace {

constexpr const char* kUnreadable = "unreadable"; // a state, and the kind of a problem
constexpr const char* kInUse = "inUse";           // the kind of a problem
constexpr double kLongestWait = 2;                // in seconds, for other programs
constexpr std::chrono::seconds kQuick{1};         // what took longer is not read again at once
constexpr int kMostReadings = 3;                  // of a file that changes while it is read
constexpr std::size_t kMostOfProblem = 1024;      // bytes of a text

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
    LibraryFileReading(const FilePlace& place, std::int64_t size, const LibraryReading& wanted)
        : path_(place.path()),
          size_(size),
          wanted_(wanted)
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
            fail(kUnreadable, other.what());
        } catch (const Failure& failure) {
            if (!isOpen_ && !isCalledAudio(path_))
                return std::nullopt;
            fail(kUnreadable, failure.what());
        }
        return std::move(record_);
    }
    /// Whether it was read to its end, as far as that can be.
    bool isComplete() const { return isComplete_; }

private:
    void readAll()
    {
        FileAccess access;
        if (wanted_.waits) {
            try {
                access = accessForReading(path_, {.timeoutSeconds = kLongestWait, .quiet = true});
            } catch (const Failure& failure) {
                isComplete_ = false;
                fail(kInUse, failure.what());
                return;
            }
        }
        CAudioFileIO file;
        readAhead(file);
        const platform::URLRef location = fileLocation(path_);
        if (const std::int32_t status = file.Open(CFileRef(location), 0); status != kStatusOK) {
            requireRegularFile(path_); // knows best what is wrong with it
            requireOK(status);
        }
        isOpen_ = true;
        describeOpened(file, path_);
        addSound(record_, file.Info());
        addProblems(file);
        addTags(file);
        addSamples(file);
    }

    /// A small file whose samples are wanted too is read at once, others by their headers, into blocks that a thread
    /// uses again for file after file.
    void readAhead(CAudioFileIO& file) const
    {
        constexpr std::size_t kWhole = 256 * 1024, kHeaders = 4096;
        const bool isWhole = (wanted_.overview || wanted_.hash) && size_ <= std::int64_t{kWhole};
        thread_local std::shared_ptr<KTMem> whole, headers;
        std::shared_ptr<KTMem>& block = isWhole ? whole : headers;
        if (!block)
            block = std::make_shared<KTMem>(isWhole ? kWhole : kHeaders);
        file.SetCache(block);
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
        platform::Error error;
        if (file.HasChunks()) {
            if (auto tags = readLoopTags(file, &error))
                addLoopTags(record_, std::move(*tags));
            else
                noteFailure(error);
        }
        if (record_.kind.empty())
            record_.kind = "recording";
        if (const auto metadata = ReadMetadataFieldsOfOpenFile(file, {}, &error)) {
            addFieldTexts(record_, metadata->fields);
            record_.fields = fieldsJson(metadata->fields);
        } else {
            noteFailure(error);
        }
    }

    /// What was not read for a reason that is no property of a kind of file, unless the reason is known already.
    void noteFailure(const platform::Error& error)
    {
        const bool isBadHeader =
            error.domain == kMetadataErrorDomain && error.code == static_cast<std::int64_t>(MetadataError::badHeader);
        if ((error.domain == platform::ErrorDomain::status || isBadHeader) && record_.problems.empty())
            addDamage(error.description);
    }

    void addDamage(const std::string& text)
    {
        record_.state = "damaged";
        addProblem(kUnreadable, text);
    }

    /// A file whose sound cannot be read has neither waveform nor hash.
    void addSamples(CAudioFileIO& file)
    {
        if (!wanted_.overview && !wanted_.hash)
            return;
        SoundPass pass = passThroughSound(file, path_, {wanted_.overview, wanted_.hash, wanted_.goesOn});
        record_.overview = std::move(pass.waveform);
        record_.soundHash = std::move(pass.hash);
        isComplete_ = pass.status != kStatusUserCancelled;
        if (isComplete_ && pass.status != kStatusOK)
            addDamage(StatusText(pass.status));
    }

    void addProblem(const char* kind, const std::string& text)
    {
        record_.problems.push_back({kind, boundedLine(text, kMostOfProblem)});
    }

    void fail(const char* kind, const std::string& text)
    {
        record_.state = kUnreadable;
        addProblem(kind, text);
    }

    const std::string path_;
    const std::int64_t size_;
    const LibraryReading& wanted_;
    bool isOpen_ = false, isComplete_ = true;
    LibraryRecord record_;
};

} // namespace

std::optional<LibraryRecord> readLibraryRecord(const FilePlace& place, const SeenStamp& stamp,
                                               const LibraryReading& wanted)
{
    const auto begin = std::chrono::steady_clock::now();
    SeenStamp before = stamp;
    for (int reading = 1;; ++reading) {
        LibraryFileReading file(place, before.size, wanted);
        auto record = file.read();
        const auto after = stampOf(place.path());
        if (!record || !after)
            return std::nullopt;
        record->stamp = *after;
        record->indexed = std::time(nullptr);
        if (*after == before && file.isComplete())
            return record;
        const bool isLast = reading == kMostReadings || std::chrono::steady_clock::now() - begin > kQuick;
        if (isLast || !file.isComplete()) {
            record->stamp.changed = record->stamp.inode = 0;
            return record;
        }
        before = *after;
    }
}

bool isInUse(const LibraryRecord& record)
{
    return record.state == kUnreadable && !record.problems.empty() && record.problems.front().kind == kInUse;
}
