// Where the threads of an update leave what they found for the one that writes.
#pragma once

#include "tool/shared/indexing/FolderListing.h"

#include <chrono>
#include <condition_variable>
#include <deque>
#include <exception>
#include <memory>
#include <mutex>
#include <optional>
#include <vector>

/// A file to be read: one of a listing, which its jobs share.
struct ReadingJob {
    std::shared_ptr<const FolderListing> folder;
    std::size_t file = 0; // its index there
    bool isKnown = false; // the index has audio in that place

    const ListedFile& listed() const { return folder->files[file]; }
};

/// What became of one.
struct FileReading {
    ReadingJob job;
    std::optional<LibraryRecord> record;
    bool isThere = false; // as it was listed; otherwise it has changed since, or is gone
};

/// Any thread may leave something; one takes.
class UpdateInbox {
public:
    /// Waits for room; false once nothing more is wanted.
    bool leave(FolderListing listing);
    /// As above.
    bool leave(FileReading reading);
    /// No listing will follow.
    void endListings();
    /// The work cannot go on: call where an exception would leave a thread. The next `take` throws it.
    void fail(std::exception_ptr problem);
    /// Lets those that wait for room go, for good.
    void close();
    /// There is always room from now on, for a thread that leaves something and takes it itself.
    void makeBoundless();

    struct Contents {
        std::vector<FolderListing> listings;
        std::vector<FileReading> readings;
        bool isWalkOver = false; // and no listing is left
    };
    /// All that is there; waits until `deadline` if there is nothing. Listings stay where they are unless they are
    /// wanted. Throws what a thread has failed with; a want of memory is a Failure.
    Contents take(bool wantsListings, std::chrono::steady_clock::time_point deadline);

private:
    static constexpr std::size_t kMostFiles = 20'000; // in listings
    static constexpr std::size_t kMostReadings = 1'000;

    std::mutex mutex_;
    std::condition_variable arrived_, room_;
    std::deque<FolderListing> listings_;
    std::vector<FileReading> readings_;
    std::size_t files_ = 0; // in the listings
    std::exception_ptr problem_;
    bool isWalkOver_ = false;
    bool isClosed_ = false;
    bool isBoundless_ = false;
};
