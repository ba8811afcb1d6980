// Writes results to a file of the user's choice.
#pragma once

#include "files/CTemporaryFile.h"
#include "platform/OwnedDescriptor.h"

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <sys/stat.h>

/// Receives bytes; throws Failure if they cannot be written.
using Sink = std::function<void(std::string_view)>;

/// A file being written. A regular file gets its name when it is complete, and until then an existing one stays as it
/// is; a device or a FIFO is written directly. Operations throw Failure.
class OutputFile {
public:
    /// Whether an existing regular file of that name may be replaced.
    enum class Existing { replace, refuse };

    /// `out` must not be the file `source`.
    OutputFile(const std::string& out, const std::string& source, Existing existing);

    void write(std::string_view bytes);

    /// Whether the output can be rewound, and opened by its path until it is finished.
    bool isRegular() const { return file_ != nullptr; }
    /// For regular files only.
    void rewrite(std::int64_t offset, std::string_view bytes);
    std::string path() const { return file_->Path(); }
    /// The path of the regular file to be replaced; empty if there is none.
    const std::string& replaced() const { return replaced_; }

    /// Without this call, the output does not exist. A replaced file keeps its owner, mode, extended attributes and all
    /// of its names: if another file cannot get these, the content is written into it.
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
    std::int64_t begun_ = 0, length_ = 0;  // written in all, and the part already being put on the disk
    std::unique_ptr<CTemporaryFile> file_; // null for a device or FIFO
    platform::OwnedDescriptor device_;
};

/// How many may be written at once.
inline constexpr unsigned kMostTemporaryFiles = 16;
/// Call before starting threads that write OutputFiles.
void prepareOutputFiles();

/// Throws the Failure of a file that an OutputFile would not replace; call before long work.
void requireFreeName(const std::string& out, OutputFile::Existing existing);

/// Writes to `out` what `produce` passes to the sink. Throws Failure.
void writeOutputFile(const std::string& out, const std::string& source, OutputFile::Existing existing,
                     const std::function<void(const Sink&)>& produce);
