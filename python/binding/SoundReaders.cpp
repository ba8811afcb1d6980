#include "binding/SoundReaders.h"

#include "binding/Interpreter.h"
#include "binding/Location.h"
#include "binding/Problem.h"

#include "platform/OperationQueue.h"

#include <algorithm>
#include <array>
#include <bit>
#include <future>
#include <thread>
#include <utility>

using platform::ConvertingReader;
using platform::StreamDescription;

namespace {

/// Read between two looks at the signals: some milliseconds of work.
constexpr std::int64_t kPieceSamples = 1 << 20;
/// What a helper is worth to be opened for.
constexpr std::int64_t kPartSamples = 1 << 20;

/// The threads of this process that decode.
std::atomic<unsigned> busyThreads{0};

class Busy {
public:
    explicit Busy(std::size_t count) : count_(static_cast<unsigned>(count)) { busyThreads += count_; }
    ~Busy() { busyThreads -= count_; }
    Busy(const Busy&) = delete;
    Busy& operator=(const Busy&) = delete;

private:
    unsigned count_;
};

/// 0, or why it ended; `done` frames were read. `goOn` is asked ahead of every piece but the first.
template <class GoOn>
std::int32_t readPieces(ConvertingReader& reader, float* to, std::int64_t start, std::int64_t wanted,
                        std::int64_t& done, GoOn goOn)
{
    const std::uint32_t channels = reader.clientFormat().channelsPerFrame;
    const std::int64_t most = std::max<std::int64_t>(kPieceSamples / channels, 1);
    done = 0;
    if (const std::int32_t status = reader.seek(start); status != kStatusOK)
        return status;
    while (done < wanted && (done == 0 || goOn())) {
        auto count = static_cast<std::uint32_t>(std::min(most, wanted - done));
        std::array buffers{
            platform::AudioBuffer{channels, count * reader.clientFormat().bytesPerFrame, to + done * channels}};
        if (const std::int32_t status = reader.read(count, buffers); status != kStatusOK)
            return status;
        if (count == 0)
            break;
        done += count;
    }
    return kStatusOK;
}

bool areEqual(const timespec& a, const timespec& b)
{
    return a.tv_sec == b.tv_sec && a.tv_nsec == b.tv_nsec;
}

} // namespace

SoundReaders::SoundReaders(std::string path, std::optional<double> rate, std::optional<std::uint32_t> channels,
                           unsigned threads)
    : path_(std::move(path)),
      location_(locationOf(path_)),
      threads_(threads)
{
    platform::Error error;
    std::int32_t status = kStatusOK;
    ::stat(location_->posixPath().c_str(), &status_);
    reader_ = ConvertingReader::open(*location_, &status, &error);
    if (reader_) {
        const StreamDescription& own = reader_->clientFormat();
        client_ = StreamDescription::packedPCM(rate.value_or(own.sampleRate), channels.value_or(own.channelsPerFrame),
                                               {32, true, false, std::endian::native});
        status = reader_->setClientFormat(client_, &error);
    }
    if (status != kStatusOK)
        throw Problem(path_, status, error.description.empty() ? StatusText(status) : error.description);
}

/// A file of the same name that took this one's place is another.
bool SoundReaders::isSameFile() const
{
    struct stat now = {};
    return ::stat(location_->posixPath().c_str(), &now) == 0 && now.st_dev == status_.st_dev &&
           now.st_ino == status_.st_ino && now.st_size == status_.st_size && areEqual(now.st_mtim, status_.st_mtim);
}

std::size_t SoundReaders::partsFor(std::int64_t wanted) const
{
    if (threads_ < 2 || reader_->fileFormat().isLinearPCM()) // which memory is too slow for as it is
        return 1;
    const unsigned processors = std::thread::hardware_concurrency(), busy = busyThreads;
    const unsigned idle = processors > busy ? processors - busy : 1;
    const std::int64_t worth = wanted / std::max<std::int64_t>(kPartSamples / client_.channelsPerFrame, 1);
    return static_cast<std::size_t>(std::clamp<std::int64_t>(worth, 1, std::min(threads_, idle)));
}

bool SoundReaders::openHelpers(std::size_t count)
{
    if (!isSameFile())
        return false;
    const std::size_t before = helpers_.size();
    while (helpers_.size() < count) {
        Reader helper = ConvertingReader::open(*location_, nullptr);
        if (!helper || helper->setClientFormat(client_) != kStatusOK)
            break;
        helpers_.push_back(std::move(helper));
    }
    if (helpers_.size() >= count && isSameFile())
        return true;
    helpers_.resize(before);
    return false;
}

struct SoundReaders::Part {
    std::int64_t begin = 0, count = 0, done = 0;
    std::int32_t status = kStatusOK;
};

/// False where not all could be read so; what stands in the array is then of no use.
bool SoundReaders::readInParts(float* to, std::int64_t start, std::int64_t wanted, std::size_t parts)
{
    if (!openHelpers(parts - 1))
        return false;
    std::vector<Part> all(parts);
    for (std::size_t i = 0; i < parts; ++i) {
        all[i].begin = wanted * static_cast<std::int64_t>(i) / static_cast<std::int64_t>(parts);
        all[i].count = wanted * static_cast<std::int64_t>(i + 1) / static_cast<std::int64_t>(parts) - all[i].begin;
    }
    std::atomic<bool> isStopped = false;
    const auto readPart = [&](std::size_t i, const auto& goOn) {
        ConvertingReader& reader = i == 0 ? *reader_ : *helpers_[i - 1];
        Part& part = all[i];
        part.status = readPieces(reader, to + part.begin * client_.channelsPerFrame, start + part.begin, part.count,
                                 part.done, goOn);
    };
    std::vector<std::future<void>> working;
    std::exception_ptr interruption;
    {
        const Busy busy(parts - 1);
        for (std::size_t i = 1; i < parts; ++i) {
            const auto work = std::make_shared<std::packaged_task<void()>>(
                [&, i] { readPart(i, [&] { return !isStopped.load(); }); });
            std::future<void> future = work->get_future();
            if (platform::runInBackground([work] { (*work)(); }))
                working.push_back(std::move(future));
        }
        try {
            readPart(0, [] {
                heedSignals();
                return true;
            });
        } catch (...) {
            isStopped = true;
            interruption = std::current_exception();
        }
        for (std::future<void>& each : working) // they write into what the caller owns
            each.wait();
    }
    if (interruption)
        std::rethrow_exception(interruption);
    // Frames that are missing are for the first reader to count, which counts each once.
    const bool isWhole = std::ranges::none_of(helpers_, [](const Reader& each) { return each->missingFrames() > 0; });
    return isWhole && std::ranges::all_of(
                          all, [](const Part& part) { return part.status == kStatusOK && part.done == part.count; });
}

std::int64_t SoundReaders::readAlone(float* to, std::int64_t start, std::int64_t wanted)
{
    std::int64_t done = 0;
    require(path_, readPieces(*reader_, to, start, wanted, done, [] {
                heedSignals();
                return true;
            }));
    return done;
}

std::int64_t SoundReaders::read(float* to, std::int64_t start, std::int64_t wanted)
{
    const Busy busy(1);
    if (const std::size_t parts = partsFor(wanted); parts > 1) {
        if (readInParts(to, start, wanted, parts))
            return wanted;
        helpers_.clear();
        threads_ = 1;
    }
    return readAlone(to, start, wanted);
}
