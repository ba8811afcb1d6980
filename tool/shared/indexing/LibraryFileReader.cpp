#include "tool/shared/indexing/LibraryFileReader.h"

#include "audiofile/fields/FileMetadata.h"
#include "loops/tags/LoopTags.h"
#include "platform/core/Status.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/description/FileDescription.h"
#include "tool/shared/description/FoundProblems.h"
#include "tool/shared/indexing/BoundedText.h"
#include "tool/shared/indexing/FieldTexts.h"
#include "tool/shared/indexing/FolderListing.h"
#include "tool/shared/indexing/LoopTagColumns.h"
#include "tool/shared/indexing/SoundColumns.h"
#include "tool/shared/indexing/SoundPass.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/input/FoundFile.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

#include <chrono>
#include <ctime>
#include <thread>

namespace {

constexpr const char* kUnreadable = "unreadable"; // a state, and the kind of a problem
constexpr const char* kInUse = "inUse";           // the kind of a problem
constexpr double kLongestWait = 2;                // in seconds, for other programs
constexpr std::chrono::seconds kQuick{1};         // what took longer is not read again at once
constexpr int kMostReadings = 3;                  // of a file that changes while it is read
constexpr std::size_t kMostOfProblem = 1024;      // bytes of a text

// A change within a tick of the clock leaves the time as it is. The system's ticks are 1 to 10 ms; a time in whole
// hundredths of a second may be that of a file system that counts in seconds, two of them on FAT.
constexpr std::chrono::milliseconds kTick{20};
constexpr std::chrono::seconds kLongTick{3};
constexpr std::int64_t kHundredth = 10'000'000; // in nanoseconds

std::chrono::nanoseconds sinceChange(const SeenStamp& stamp)
{
    return std::chrono::system_clock::now().time_since_epoch() - std::chrono::nanoseconds(stamp.changed);
}

/// Whether a later change would show in the stamp. Waits for the end of a short tick, not of a long one.
bool showsChanges(const SeenStamp& stamp)
{
    const auto age = sinceChange(stamp);
    if (age < std::chrono::nanoseconds::zero()) // by another clock
        return true;
    if (age < kTick)
        std::this_thread::sleep_for(kTick - age);
    return age > kLongTick || stamp.changed % kHundredth != 0;
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
    /// Whether it had the size and time of the stamp when it was opened. The system changes these one after the other,
    /// so that a file that is written may look the same before and after.
    bool wasOpenedAs(const SeenStamp& stamp) const
    {
        return !atOpen_ || *atOpen_ == FileStamp{stamp.size, stamp.changed};
    }

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
        atOpen_ = file.StampAtOpen();
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
    std::optional<FileStamp> atOpen_;
    LibraryRecord record_;
};

} // namespace

std::optional<LibraryRecord> readLibraryRecord(const FilePlace& place, const SeenStamp& stamp,
                                               const LibraryReading& wanted)
{
    const auto begin = std::chrono::steady_clock::now();
    SeenStamp before = stamp;
    for (int reading = 1;; ++reading) {
        const bool isProof = showsChanges(before);
        LibraryFileReading file(place, before.size, wanted);
        auto record = file.read();
        const auto after = stampOfFile(place.path());
        if (!record || !after)
            return std::nullopt;
        record->stamp = *after;
        record->indexed = std::time(nullptr);
        const bool isSame = *after == before && file.wasOpenedAs(before);
        if (isSame && isProof && file.isComplete())
            return record;
        const bool isLast = reading == kMostReadings || std::chrono::steady_clock::now() - begin > kQuick;
        if (isSame || isLast || !file.isComplete()) {
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
