// JSON written as it comes, for what is too large to be held as a tree of values first.
#pragma once

#include "tool/shared/output/Output.h"

#include <charconv>
#include <cmath>
#include <concepts>
#include <cstddef>
#include <cstring>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

/// Commas are its own business; what belongs where is the caller's.
class JsonWriter {
public:
    explicit JsonWriter(Output& output) : output_(output) {}
    JsonWriter(const JsonWriter&) = delete;
    JsonWriter& operator=(const JsonWriter&) = delete;
    ~JsonWriter() { flush(); }

    void beginObject() { begin('{'); }
    void endObject() { end('}'); }
    void beginArray() { begin('['); }
    void endArray() { end(']'); }
    /// A line of its own for what comes next, ahead of which no comma is missing any more.
    void newLine()
    {
        separate();
        put('\n');
    }

    void key(std::string_view name)
    {
        write(name);
        put(':');
        isFirst_ = true;
    }
    /// A key that is known when this is compiled must need no escapes.
    template <std::size_t size>
    void key(const char (&name)[size])
    {
        separate();
        char* to = room(size + 2);
        *to++ = '"';
        std::memcpy(to, name, size - 1);
        std::memcpy(to + size - 1, "\":", 2);
        used_ += size + 2;
    }
    template <class Value>
    void member(const auto& name, const Value& value)
    {
        key(name);
        write(value);
    }

    void write(std::string_view text);
    void write(const std::string& text) { write(std::string_view(text)); }
    void write(std::integral auto value)
    {
        if constexpr (std::same_as<decltype(value), bool>)
            append(value ? "true" : "false");
        else
            append(value);
    }
    /// The shortest text that is read back as the same number; null for what is none.
    void write(float value)
    {
        if (const int whole = static_cast<int>(std::fabs(value) < 1000 ? value : 0); value == static_cast<float>(whole))
            append(whole); // most are, and it is much quicker
        else if (std::isfinite(value))
            append(value);
        else
            append("null");
    }
    template <class Value>
    void write(const std::optional<Value>& value)
    {
        if (value)
            write(*value);
        else
            append("null");
    }
    template <class Value>
    void write(const std::vector<Value>& values)
    {
        beginArray();
        for (const Value& value : values)
            write(value);
        endArray();
    }

    /// False when what was written goes nowhere: there is no use in writing on.
    bool flush();

private:
    static constexpr std::size_t kBufferSize = 64 * 1024;

    /// Where the next `size` bytes go, at most `kBufferSize`.
    char* room(std::size_t size)
    {
        if (size > kBufferSize - used_)
            flush();
        return buffer_.data() + used_;
    }
    void put(char character)
    {
        *room(1) = character;
        ++used_;
    }
    void put(std::string_view text)
    {
        if (text.size() > kBufferSize) {
            flush();
            output_.write(text);
            return;
        }
        std::memcpy(room(text.size()), text.data(), text.size());
        used_ += text.size();
    }

    void separate()
    {
        if (!isFirst_)
            put(',');
        isFirst_ = true;
    }
    void begin(char bracket)
    {
        separate();
        put(bracket);
    }
    void end(char bracket)
    {
        put(bracket);
        isFirst_ = false;
    }
    void append(std::string_view text)
    {
        separate();
        put(text);
        isFirst_ = false;
    }
    template <class Number>
        requires std::integral<Number> || std::floating_point<Number>
    void append(Number value)
    {
        constexpr std::size_t longest = 40;
        separate();
        char* const to = room(longest);
        used_ += static_cast<std::size_t>(std::to_chars(to, to + longest, value).ptr - to);
        isFirst_ = false;
    }

    Output& output_;
    std::vector<char> buffer_ = std::vector<char>(kBufferSize);
    std::size_t used_ = 0;
    bool isFirst_ = true; // no comma is needed ahead of what comes next
};
