#include "audiofile/fields/readers/MetaFields.h"

#include "platform/core/HexText.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <utility>

namespace {

constexpr std::size_t kPreviewSize = 32;

} // namespace

std::uint32_t MetaNameCounts::add(const std::vector<MetaField>& fields, std::size_t index, std::size_t placeHash)
{
    if (2 * (taken_ + 1) > slots_.size())
        grow();
    const MetaField& field = fields[index];
    const std::size_t hash = placeHash * 31 + std::hash<std::string_view>()(field.name);
    for (std::size_t at = hash;; ++at) {
        Slot& slot = slots_[at & (slots_.size() - 1)];
        if (slot.field == 0) {
            slot = {hash, static_cast<std::uint32_t>(index + 1), 0};
            ++taken_;
        } else if (const MetaField& first = fields[slot.field - 1];
                   slot.hash != hash || first.name != field.name || first.place != field.place) {
            continue;
        }
        return slot.count++;
    }
}

void MetaNameCounts::grow()
{
    constexpr std::size_t least = 128;
    const std::vector<Slot> before = std::exchange(slots_, std::vector<Slot>(std::max(least, 2 * slots_.size())));
    for (const Slot& slot : before) {
        if (slot.field == 0)
            continue;
        std::size_t at = slot.hash;
        while (slots_[at & (slots_.size() - 1)].field != 0)
            ++at;
        slots_[at & (slots_.size() - 1)] = slot;
    }
}

void MetaFields::enter(const MetaChunk& chunk, std::string_view group)
{
    enterShared(chunk, group);
    if (const std::size_t count = places_[here_.group]++; count != 0)
        appendIndex(here_.place, count);
    placeHash_ = std::hash<std::string>()(here_.place);
}

void MetaFields::enterShared(const MetaChunk& chunk, std::string_view group)
{
    here_ = {};
    here_.group = here_.place = group;
    here_.chunk = chunk.id;
    here_.offset = chunk.offset;
    placeHash_ = std::hash<std::string>()(here_.place);
}

MetaField& MetaFields::add(std::string_view name, MetaField::Value value)
{
    MetaField& field = fields_.emplace_back(here_);
    field.name = platform::decodeFileText(name, fallback_).utf8; // keys are texts from the file too
    field.value = std::move(value);
    if (const std::uint32_t count = names_.add(fields_, fields_.size() - 1, placeHash_); count != 0)
        appendIndex(field.name, count);
    return field;
}

void MetaFields::text(std::string_view name, std::string_view bytes, std::string_view words)
{
    if (bytes.empty())
        return;
    platform::FileText text = platform::decodeFileText(bytes, fallback_);
    MetaField& field = add(name, std::move(text.utf8));
    field.words = words;
    field.encoding = text.encoding;
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

void appendIndex(std::string& text, std::size_t index)
{
    char digits[20];
    text += '[';
    text.append(digits, std::to_chars(digits, std::end(digits), index).ptr);
    text += ']';
}

std::string itemName(std::string_view name, std::size_t index)
{
    std::string item(name);
    appendIndex(item, index);
    item += '.';
    return item;
}
