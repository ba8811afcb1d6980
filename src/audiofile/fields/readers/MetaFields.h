// How fields are collected: as a list of stable names.
#pragma once

#include "audiofile/fields/MetaField.h"
#include "platform/FileText.h"

#include <concepts>
#include <map>
#include <string>
#include <string_view>
#include <vector>

/// How many fields of a place have had a name, found by hashes that need no copies of the names.
class MetaNameCounts {
public:
    /// Counts one more field, `index` of `fields`, under the name that it has now; returns how many had it before.
    /// `placeHash` is any hash of its place.
    std::uint32_t add(const std::vector<MetaField>& fields, std::size_t index, std::size_t placeHash);

private:
    struct Slot {
        std::size_t hash = 0;
        std::uint32_t field = 0; // the first of the name, counted from 1; 0: free
        std::uint32_t count = 0;
    };
    void grow();

    std::vector<Slot> slots_; // a power of two, at most half of them taken
    std::size_t taken_ = 0;
};

/// Collects fields, and gives those of the same name different ones: "info.IART", "info.IART[1]".
class MetaFields {
public:
    /// The rate tells the time of numbers of frames; 0 where it is not known. Texts that are not UTF-8 are in
    /// `fallback`.
    explicit MetaFields(double sampleRate, platform::FallbackEncoding fallback = platform::FallbackEncoding::latin1)
        : sampleRate_(sampleRate),
          fallback_(fallback)
    {
        fields_.reserve(kUsualFields);
    }

    /// From now on fields are of this chunk.
    void enter(const MetaChunk& chunk, std::string_view group);
    /// The same, of a chunk that says more of what others tell under the group.
    void enterShared(const MetaChunk& chunk, std::string_view group);

    /// Nothing for an empty text.
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
    /// A place in the sound or a length of it.
    void frames(std::string_view name, std::uint64_t frames);
    void frames(std::string_view name, double frames);
    /// All bytes in hexadecimal.
    void hex(std::string_view name, BytesView bytes);
    /// The first bytes of what is not understood; nothing of no bytes.
    void preview(std::string_view name, BytesView bytes, std::uint64_t size, std::string_view words = "");
    /// What follows the fields of a chunk: nothing of zeros.
    void behind(BytesView bytes);
    /// Nothing of 0.
    void missing(std::uint64_t count);

    std::vector<MetaField> take() { return std::move(fields_); }

private:
    static constexpr std::size_t kUsualFields = 128;

    MetaField& add(std::string_view name, MetaField::Value value);

    double sampleRate_;
    platform::FallbackEncoding fallback_;
    MetaField here_; // the parts that fields share
    std::size_t placeHash_ = 0;
    std::map<std::string, std::size_t> places_;
    MetaNameCounts names_;
    std::vector<MetaField> fields_;
};

/// `[index]`.
void appendIndex(std::string& text, std::size_t index);
/// `name[index].` ahead of the fields of one item of several.
std::string itemName(std::string_view name, std::size_t index);
