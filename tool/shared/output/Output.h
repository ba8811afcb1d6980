// Standard output, buffered, without losing track of failures as streams do.
#pragma once

#include "platform/core/TextBuffer.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <iterator>
#include <string>
#include <string_view>

/// The choice of --json and --jsonl.
enum class JsonShape { none, array, lines };

/// The options that every verb takes, and --csv.
struct OutputOptions {
    JsonShape json = JsonShape::none;
    bool csv = false; // for verbs that have it; never together with JSON
    bool quiet = false;
    ColorMode color = ColorMode::automatic;

    bool wantsJson() const { return json != JsonShape::none; }
};

/// The form of results: for people, lines for scripts, JSON, CSV, or nothing.
enum class Form { table, lines, json, csv, none };

/// JSON or CSV if requested; else nothing if quiet; else a table on a terminal or if colour is forced; else lines.
Form outputForm(const OutputOptions& options);

/// The only writer to standard output. After a failed write (full disk, closed pipe) the rest is dropped.
class Output : public TextOutput {
public:
    static Output& standard();

    template <class... Arguments>
    void print(fmt::format_string<Arguments...> format, Arguments&&... arguments)
    {
        formatted_.clear();
        fmt::format_to(std::back_inserter(formatted_), format, std::forward<Arguments>(arguments)...);
        buffer().append({formatted_.data(), formatted_.size()});
        if (buffer().size() >= kFlushSize)
            flush();
    }
    void write(std::string_view bytes) override;
    bool flush() override;
    bool failed() const { return error_ != 0; }
    /// Flushes; false if anything was lost, after a line on standard error unless the reader is gone.
    bool finish();

private:
    void writeThrough(std::string_view bytes);

    fmt::memory_buffer formatted_; // by `print`, kept for its memory
    int error_ = 0;
};
