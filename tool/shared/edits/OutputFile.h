// Results that the command writes to a file of the user's choice.
#pragma once

#include "tool/shared/access/Descriptor.h"
#include "tool/shared/edits/TemporaryFile.h"

#include <cstdint>
#include <functional>
#include <optional>
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
    bool isRegular() const { return file_.has_value(); }
    /// Of a regular file only.
    void rewrite(std::int64_t offset, std::string_view bytes);
    std::string path() const { return file_->path(); }
    /// The path of the regular file that it is going to replace; empty when there is none.
    const std::string& replaced() const { return replaced_; }

    /// Without this, nothing has been written. What is replaced keeps its owner, mode, extended attributes and all of
    /// its names: where no other file can have them, the content goes into it.
    void finish();

private:
    void takePlaceOf(const Descriptor& replaced);
    void writeInto(const Descriptor& replaced);

    std::string out_, target_, replaced_; // as given, and with symbolic links resolved
    Existing existing_;
    mode_t mode_ = 0;
    std::optional<TemporaryFile> file_;
    Descriptor device_;
};

/// Throws the Failure of a file that an OutputFile would not replace: ahead of long work.
void requireFreeName(const std::string& out, OutputFile::Existing existing);

/// Writes what `produce` hands to the sink to `out`. Throws Failure.
void writeOutputFile(const std::string& out, const std::string& source, OutputFile::Existing existing,
                     const std::function<void(const Sink&)>& produce);
