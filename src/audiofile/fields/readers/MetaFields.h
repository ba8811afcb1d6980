// Collects fields as a list with unique names.
#pragma once

#include "audiofile/fields/MetaField.h"
#include "platform/FileText.h"

#include <concepts>
#include <map>
#include <string>
#include <string_view>
#include <vector>

/// Counts the fields of a place by name, with hashes instead of copies of the names.
class MetaNameCounts {
public:
    /// Counts another field, `index` of `fields`, under its present name; returns how many had that name before.
    /// `placeHash` is any hash of its place.
    std::uint32_t add(const std::vector<MetaField>& fields, std::size_t index, std::size_t placeHash);

private:
    struct Slot {
        std::size_t hash = 0;
        std::uint32_t field = 0; // the first with that name, counted from 1; 0 if the slot is free
        std::uint32_t count = 0;
    };
    void grow();

    std::vector<Slot> slots_; // a power of two, at most half of them used
    std::size_t taken_ = 0;
};

/// Collects fields, and makes equal names unique: "info.IART", "info.IART[1]".
class MetaFields {
public:
    /// The rate converts numbers of frames to times; 0 if it is unknown. Texts that are not UTF-8 are read as
    /// `fallback`.
    explicit MetaFields(double sampleRate, platform::FallbackEncoding fallback = platform::FallbackEncoding::latin1)
        : sampleRate_(sampleRate),
          fallback_(fallback)
    {
        fields_.reserve(kUsualFields);
    }

    /// The following fields belong to this chunk.
    void enter(const MetaChunk& chunk, std::string_view group);
    /// As above, for a chunk that adds to a group of other chunks.
    void enterShared(const MetaChunk& chunk, std::string_view group);

    /// Ignores an empty text.
    void text(std::string_view name, std::string_view bytes, std::string_view words = "");
    template <class Number>
        requires std::integral<Number> || std::floating_point<Number>
    void number(std::string_view name, Number value, std::string_view words = "")
    {
        if constexpr (std::floating_point<Number>)
            add(name, double{value}).words = words;
        else if constexpr (std::unsigned_integral<Number>)
            add(name, std::uint64_t{value}).words = words;
        else
            add(name, std::int64_t{value}).words = words;
    }
    /// Adds a position or length in the sound.
    void frames(std::string_view name, std::uint64_t frames);
    void frames(std::string_view name, double frames);
    /// Adds all bytes in hexadecimal.
    void hex(std::string_view name, BytesView bytes);
    /// Adds the first bytes of data that is not interpreted; ignores empty data.
    void preview(std::string_view name, BytesView bytes, std::uint64_t size, std::string_view words = "");
    /// Adds bytes after the fields of a chunk; ignores zeros.
    void behind(BytesView bytes);
    /// Ignores 0.
    void missing(std::uint64_t count);

    std::vector<MetaField> take() { return std::move(fields_); }

private:
    static constexpr std::size_t kUsualFields = 128;

    MetaField& add(std::string_view name, MetaField::Value value);

    double sampleRate_;
    platform::FallbackEncoding fallback_;
    MetaField here_; // parts that fields share
    std::size_t placeHash_ = 0;
    std::map<std::string, std::size_t> places_;
    MetaNameCounts names_;
    std::vector<MetaField> fields_;
};

/// `[index]`.
void appendIndex(std::string& text, std::size_t index);
/// `name[index].`, the start of the names of an item's fields.
std::string itemName(std::string_view name, std::size_t index);
