#include "tool/shared/indexing/UpdateInbox.h"

#include "tool/shared/output/Failure.h"

#include <iterator>
#include <new>
#include <utility>

namespace {

[[noreturn]] void throwAgain(const std::exception_ptr& problem)
{
    try {
        std::rethrow_exception(problem);
    } catch (const std::bad_alloc&) {
        throw Failure("out of memory");
    }
}

} // namespace

bool UpdateInbox::leave(FolderListing listing)
{
    std::unique_lock lock(mutex_);
    room_.wait(lock, [this] { return isClosed_ || isBoundless_ || files_ < kMostFiles; });
    if (isClosed_)
        return false;
    files_ += listing.files.size() + 1;
    listings_.push_back(std::move(listing));
    arrived_.notify_one();
    return true;
}

bool UpdateInbox::leave(FileReading reading)
{
    std::unique_lock lock(mutex_);
    room_.wait(lock, [this] { return isClosed_ || isBoundless_ || readings_.size() < kMostReadings; });
    if (isClosed_)
        return false;
    readings_.push_back(std::move(reading));
    if (readings_.size() == 1)
        arrived_.notify_one();
    return true;
}

void UpdateInbox::endListings()
{
    const std::lock_guard lock(mutex_);
    isWalkOver_ = true;
    arrived_.notify_one();
}

void UpdateInbox::fail(std::exception_ptr problem)
{
    const std::lock_guard lock(mutex_);
    problem_ = std::move(problem);
    arrived_.notify_one();
}

void UpdateInbox::close()
{
    const std::lock_guard lock(mutex_);
    isClosed_ = true;
    room_.notify_all();
}

void UpdateInbox::makeBoundless()
{
    const std::lock_guard lock(mutex_);
    isBoundless_ = true;
}

UpdateInbox::Contents UpdateInbox::take(bool wantsListings, std::chrono::steady_clock::time_point deadline)
{
    std::unique_lock lock(mutex_);
    arrived_.wait_until(lock, deadline, [&] {
        return problem_ || !readings_.empty() || (wantsListings && (!listings_.empty() || isWalkOver_));
    });
    if (problem_)
        throwAgain(problem_);
    Contents contents;
    contents.readings = std::exchange(readings_, {});
    if (wantsListings) {
        contents.listings.assign(std::make_move_iterator(listings_.begin()), std::make_move_iterator(listings_.end()));
        listings_.clear();
        files_ = 0;
    }
    contents.isWalkOver = isWalkOver_ && listings_.empty();
    room_.notify_all();
    return contents;
}
