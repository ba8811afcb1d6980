// Lines of a file, a pipe or standard input.
#pragma once

#include "platform/OwnedDescriptor.h"

#include <cstddef>
#include <string>
#include <string_view>

/// Operations throw Failure: for what cannot be read, and for a line of more than 64 MiB, so that a pipe that ends no
/// line does not fill the memory.
class InputLines {
public:
    /// "-" is standard input.
    explicit InputLines(const std::string& name);

    /// The next line, without its end; false at the end. Valid until the next call.
    bool next(std::string_view& line);
    /// The number of that line, counted from 1.
    std::size_t number() const { return number_; }
    /// Whether the text begins so; before the first line only, and for few bytes.
    bool beginsWith(std::string_view bytes);

private:
    /// False at the end of the input.
    bool readMore();

    platform::OwnedDescriptor opened_; // none for standard input
    int descriptor_;
    std::string buffer_;
    std::size_t start_ = 0; // of what was not given yet
    std::size_t number_ = 0;
};
