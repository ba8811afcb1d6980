// Standard output, buffered, with the failures that a stream forgets.
#pragma once

#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <iterator>
#include <string>
#include <string_view>

/// What is asked for with --json and --jsonl.
enum class JsonShape { none, array, lines };

/// The options that every verb takes, and that of CSV.
struct OutputOptions {
    JsonShape json = JsonShape::none;
    bool csv = false; // of verbs that have it; never beside JSON
    bool quiet = false;
    ColorMode color = ColorMode::automatic;

    bool wantsJson() const { return json != JsonShape::none; }
};

/// How results are written: for people, for scripts by line, as JSON or as CSV, or not at all.
enum class Form { table, lines, json, csv, none };

/// JSON or CSV where asked for; else nothing when quiet; else a table on a terminal and wherever colour is demanded.
Form outputForm(const OutputOptions& options);

/// The one writer to standard output. After a failed write (a full disk, a closed pipe) the rest is dropped.
class Output {
public:
    static Output& standard();

    template <class... Arguments>
    void print(fmt::format_string<Arguments...> format, Arguments&&... arguments)
    {
        fmt::format_to(std::back_inserter(buffer_), format, std::forward<Arguments>(arguments)...);
        if (buffer_.size() >= kFlushSize)
            flush();
    }
    void write(std::string_view bytes);
    /// False when anything could not be written.
    bool flush();
    bool failed() const { return error_ != 0; }
    /// Flushes; false when anything was lost, after one line on standard error unless the reader has gone away.
    bool finish();

private:
    friend class JsonWriter; // which formats in place
    static constexpr std::size_t kFlushSize = 64 * 1024;
    void writeThrough(std::string_view bytes);

    fmt::memory_buffer buffer_;
    int error_ = 0;
};
