#include "tool/meta/MetaFields.h"

#include "tool/shared/output/DisplayWidth.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>

namespace {

constexpr std::size_t kPreviewSize = 32;

bool isUTF8(std::string_view text)
{
    constexpr char32_t replacement = 0xFFFD; // which may be there itself, in three bytes
    while (!text.empty()) {
        const std::size_t before = text.size();
        if (takeCharacter(text) == replacement && before - text.size() == 1)
            return false;
    }
    return true;
}

std::string fromLatin1(std::string_view bytes)
{
    std::string text;
    for (const char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 0x80) {
            text += c;
        } else {
            text += static_cast<char>(0xC0 | byte >> 6);
            text += static_cast<char>(0x80 | (byte & 0x3F));
        }
    }
    return text;
}

std::string hexText(BytesView bytes)
{
    std::string text;
    for (const std::byte byte : bytes)
        fmt::format_to(std::back_inserter(text), "{:02x}", std::to_integer<unsigned>(byte));
    return text;
}

} // namespace

void MetaFields::enter(const MetaChunk& chunk, std::string_view group)
{
    enterShared(chunk, group);
    if (const int count = places_[here_.group]++; count != 0)
        here_.place = fmt::format("{}[{}]", group, count);
}

void MetaFields::enterShared(const MetaChunk& chunk, std::string_view group)
{
    here_ = {};
    here_.group = here_.place = group;
    here_.chunk = chunk.id;
    here_.offset = chunk.offset;
}

MetaField& MetaFields::add(std::string_view name, MetaField::Value value)
{
    MetaField& field = fields_.emplace_back(here_);
    field.name = isUTF8(name) ? std::string(name) : fromLatin1(name); // keys are texts of the file too
    field.value = std::move(value);
    if (const int count = names_[field.fullName()]++; count != 0)
        field.name += fmt::format("[{}]", count);
    return field;
}

void MetaFields::text(std::string_view name, std::string_view bytes, std::string_view words)
{
    if (bytes.empty())
        return;
    const bool isLatin1 = !isUTF8(bytes);
    MetaField& field = add(name, isLatin1 ? fromLatin1(bytes) : std::string(bytes));
    field.words = words;
    field.isLatin1 = isLatin1;
}

void MetaFields::frames(std::string_view name, std::uint64_t frames)
{
    MetaField& field = add(name, frames);
    if (sampleRate_ > 0)
        field.seconds = static_cast<double>(frames) / sampleRate_;
}

void MetaFields::frames(std::string_view name, double frames)
{
    MetaField& field = add(name, frames);
    if (const double seconds = frames / sampleRate_; sampleRate_ > 0 && std::isfinite(seconds))
        field.seconds = seconds;
}

void MetaFields::hex(std::string_view name, BytesView bytes)
{
    add(name, hexText(bytes));
}

void MetaFields::preview(std::string_view name, BytesView bytes, std::uint64_t size, std::string_view words)
{
    const BytesView head = bytes.first(std::min(bytes.size(), kPreviewSize));
    MetaField& field = add(name, hexText(head));
    field.byteSize = size;
    field.words = words;
    for (const char c : textOf(head))
        field.ascii += c >= 0x20 && c < 0x7F ? c : '.';
}

void MetaFields::behind(BytesView bytes)
{
    if (std::ranges::any_of(bytes, [](std::byte byte) { return byte != std::byte{0}; }))
        preview("behind", bytes, bytes.size());
}

void MetaFields::missing(std::uint64_t count)
{
    if (count != 0)
        number("missing", count, "stated, and not there");
}

std::string itemName(std::string_view name, std::size_t index)
{
    return fmt::format("{}[{}].", name, index);
}
