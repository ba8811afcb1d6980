// Results that the command writes to a file of the user's choice.
#pragma once

#include "files/CTemporaryFile.h"
#include "platform/OwnedDescriptor.h"

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <sys/stat.h>

/// Takes bytes; throws Failure when they cannot be written.
using Sink = std::function<void(std::string_view)>;

/// A file being written. A regular file takes its name when it is whole, and until then leaves what has it alone; a
/// device or a FIFO is written as it is. Operations throw Failure.
class OutputFile {
public:
    /// Whether a regular file that has the name already may be replaced.
    enum class Existing { replace, refuse };

    /// `out` must not be the file `source`.
    OutputFile(const std::string& out, const std::string& source, Existing existing);

    void write(std::string_view bytes);

    /// Whether it can be gone back to, and be opened by its path until it is finished.
    bool isRegular() const { return file_ != nullptr; }
    /// Of a regular file only.
    void rewrite(std::int64_t offset, std::string_view bytes);
    std::string path() const { return file_->Path(); }
    /// The path of the regular file that it is going to replace; empty when there is none.
    const std::string& replaced() const { return replaced_; }

    /// Without this, nothing has been written. What is replaced keeps its owner, mode, extended attributes and all of
    /// its names: where no other file can have them, the content goes into it.
    void finish();

private:
    void letTheDiskBegin(std::size_t written);
    platform::OwnedDescriptor openReplaced() const;
    void publish();
    void takePlaceOf(const platform::OwnedDescriptor& replaced);
    void writeInto(const platform::OwnedDescriptor& replaced);

    std::string out_, target_, replaced_; // as given, and with symbolic links resolved
    Existing existing_;
    mode_t mode_ = 0;
    std::int64_t begun_ = 0, length_ = 0;  // of what was written, how much the disk was told of, and all
    std::unique_ptr<CTemporaryFile> file_; // null: it is none
    platform::OwnedDescriptor device_;
};

/// How many may be written at once.
inline constexpr unsigned kMostTemporaryFiles = 16;
/// Ahead of threads that write OutputFiles.
void prepareOutputFiles();

/// Throws the Failure of a file that an OutputFile would not replace: ahead of long work.
void requireFreeName(const std::string& out, OutputFile::Existing existing);

/// Writes what `produce` hands to the sink to `out`. Throws Failure.
void writeOutputFile(const std::string& out, const std::string& source, OutputFile::Existing existing,
                     const std::function<void(const Sink&)>& produce);
