// JSON, written as it comes, so that nothing is held as a tree of values first.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/TextBuffer.h"
#include "platform/core/Value.h"

#include <charconv>
#include <cmath>
#include <concepts>
#include <cstddef>
#include <cstring>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

/// Commas and escapes are its own business; what belongs where is the caller's. Without line breaks but for those that
/// are asked for.
class KT_EXPORT JsonWriter {
public:
    /// To the output, by way of its buffer.
    explicit JsonWriter(TextOutput& output) : buffer_(output.buffer()), output_(&output) {}
    /// Keeps the text, for `text`.
    JsonWriter() : buffer_(ownBuffer_) {}
    JsonWriter(const JsonWriter&) = delete;
    JsonWriter& operator=(const JsonWriter&) = delete;
    /// What was kept.
    std::string_view text() const { return ownBuffer_.view(); }

    JsonWriter& beginObject() { return begin('{'); }
    JsonWriter& endObject() { return end('}'); }
    JsonWriter& beginArray() { return begin('['); }
    JsonWriter& endArray() { return end(']'); }
    /// Of an array whose elements began with `newLine`, if there are any.
    JsonWriter& endArrayOfLines()
    {
        if (!isFirst_ && !keepsToOneLine_)
            put('\n');
        return end(']');
    }
    /// A line of its own for what comes next, ahead of which no comma is missing any more.
    JsonWriter& newLine()
    {
        separate();
        if (!keepsToOneLine_)
            put('\n');
        return *this;
    }
    /// From now on `newLine` breaks no line.
    void keepToOneLine() { keepsToOneLine_ = true; }
    /// Behind all.
    JsonWriter& endLine()
    {
        put('\n');
        isFirst_ = true;
        return *this;
    }

    /// Ahead of a value of an object.
    JsonWriter& key(std::string_view name)
    {
        write(name);
        put(':');
        isFirst_ = true;
        return *this;
    }
    /// A key that is known when this is compiled must need no escapes.
    template <std::size_t size>
    JsonWriter& key(const char (&name)[size])
    {
        separate();
        char* to = room(size + 2);
        *to++ = '"';
        std::memcpy(to, name, size - 1);
        std::memcpy(to + size - 1, "\":", 2);
        advance(size + 2);
        return *this;
    }
    /// A key with its value.
    template <class Value>
    JsonWriter& member(const auto& name, const Value& value)
    {
        return key(name).write(value);
    }

    /// The member, unless the value is none: what is not known has no key.
    template <class Value>
    JsonWriter& knownMember(const auto& name, const Value& value)
    {
        return isNone(value) ? *this : member(name, value);
    }

    /// Bytes that are not UTF-8 become U+FFFD; what could not be seen is escaped.
    JsonWriter& write(std::string_view text);
    /// The same of a text of another type.
    JsonWriter& write(const std::string& text) { return write(std::string_view(text)); }
    /// The same of a text that ends with a NUL.
    JsonWriter& write(const char* text) { return write(std::string_view(text)); }
    /// A number, or true or false.
    JsonWriter& write(std::integral auto value)
    {
        if constexpr (std::same_as<decltype(value), bool>)
            return append(value ? "true" : "false");
        else
            return append(value);
    }
    /// The shortest text that is read back as the same number; null for what is none.
    JsonWriter& write(float value)
    {
        if (const int whole = static_cast<int>(std::fabs(value) < 1000 ? value : 0); value == static_cast<float>(whole))
            return append(whole); // most are, and it is much quicker
        return std::isfinite(value) ? append(value) : writeNull();
    }
    /// The same, with a fraction or an exponent always: 120.0 is no integer.
    JsonWriter& write(double value);
    /// null, for what is known to be none.
    JsonWriter& writeNull() { return append("null"); }
    /// The value, or null.
    template <class Value>
    JsonWriter& write(const std::optional<Value>& value)
    {
        return value ? write(*value) : writeNull();
    }
    /// An array.
    template <class Value>
    JsonWriter& write(const std::vector<Value>& values)
    {
        beginArray();
        for (const Value& value : values)
            write(value);
        return endArray();
    }
    /// Data as base64, dates as ISO 8601 in UTC.
    JsonWriter& write(const platform::Value& value);
    /// What another writer kept.
    JsonWriter& writeJson(std::string_view json) { return append(json); }

private:
    template <class Value>
    static bool isNone(const std::optional<Value>& value)
    {
        return !value;
    }
    static bool isNone(const std::string& text) { return text.empty(); }
    static bool isNone(std::floating_point auto value) { return !std::isfinite(value); }
    static bool isNone(const platform::Value& value) { return value.isNull(); }

    /// Where the next `size` bytes go.
    char* room(std::size_t size)
    {
        if (output_ != nullptr && buffer_.size() + size > TextOutput::kFlushSize)
            output_->flush();
        return buffer_.room(size);
    }
    void advance(std::size_t size) { buffer_.advance(size); }
    void put(char character)
    {
        *room(1) = character;
        advance(1);
    }
    void put(std::string_view text)
    {
        if (output_ != nullptr && text.size() > TextOutput::kFlushSize) {
            output_->write(text);
            return;
        }
        std::memcpy(room(text.size()), text.data(), text.size());
        advance(text.size());
    }
    void putEscaped(std::string_view text);

    void separate()
    {
        if (!isFirst_)
            put(',');
        isFirst_ = true;
    }
    JsonWriter& begin(char bracket)
    {
        separate();
        put(bracket);
        return *this;
    }
    JsonWriter& end(char bracket)
    {
        put(bracket);
        isFirst_ = false;
        return *this;
    }
    JsonWriter& append(std::string_view text)
    {
        separate();
        put(text);
        isFirst_ = false;
        return *this;
    }
    template <class Number>
    requires std::integral<Number> || std::floating_point<Number> JsonWriter& append(Number value)
    {
        constexpr std::size_t longest = 40;
        separate();
        char* const to = room(longest);
        advance(static_cast<std::size_t>(std::to_chars(to, to + longest, value).ptr - to));
        isFirst_ = false;
        return *this;
    }

    TextBuffer ownBuffer_;
    TextBuffer& buffer_; // its own, or that of the output
    TextOutput* output_ = nullptr;
    bool keepsToOneLine_ = false;
    bool isFirst_ = true; // no comma is needed ahead of what comes next
};
