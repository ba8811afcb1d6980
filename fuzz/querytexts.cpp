// The values of queries and the keys of files, from any text: a value is a number that queries can be asked with, and a
// key that was understood is understood as the same key when it is written out. The first byte chooses the kind of
// value.
#include "tool/shared/library/KeyText.h"
#include "tool/shared/library/QueryValues.h"

#include <cmath>
#include <cstdlib>

namespace {

void require(bool holds)
{
    if (!holds)
        std::abort();
}

bool isMode(const std::string& mode)
{
    return mode.empty() || mode == "major" || mode == "minor";
}

void readFileKey(std::string_view text)
{
    const auto key = keyOfText(text);
    if (!key)
        return;
    require(key->note >= 0 && key->note < 12 && isMode(key->mode));
    const auto again = keyFromText(keyText(key->note, key->mode));
    require(again && again->note == key->note && again->mode == key->mode);
    if (const auto same = keyOfText(keyText(key->note, key->mode)); !key->mode.empty())
        require(same && same->note == key->note && same->mode == key->mode);
}

void readQueryKey(std::string_view text)
{
    const auto key = keyFromText(text);
    if (!key)
        return;
    require(isMode(key->mode) && (key->note || !key->mode.empty()));
    require(!key->note || (*key->note >= 0 && *key->note < 12));
}

void requireRange(const std::optional<NumberRange>& range)
{
    require(!range || range->least <= range->most);
    require(!range || std::isfinite(range->least) || std::isfinite(range->most));
}

void requireNumber(const std::optional<double>& number)
{
    require(!number || (std::isfinite(*number) && *number >= 0));
}

void readNumbers(std::string_view text)
{
    for (const auto read : {plainNumberFromText, secondsFromText, rateFromText}) {
        requireNumber(read(text));
        requireRange(rangeFromText(text, read));
    }
    requireRange(tempoFromText(text));
}

void readMoment(std::string_view text)
{
    // Up to 317 years before 1970, and the year 2200.
    const auto moment = sinceFromText(text);
    require(!moment || (*moment > -std::int64_t{9'000'000'000'000'000'000} && *moment < 7'290'000'000'000'000'000));
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size == 0)
        return 0;
    constexpr void (*kReaders[])(std::string_view) = {readFileKey, readQueryKey, readNumbers, readMoment};
    kReaders[*data % std::size(kReaders)]({reinterpret_cast<const char*>(data) + 1, size - 1});
    return 0;
}
