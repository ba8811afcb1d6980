#include "tool/shared/library/LibraryQueryOptions.h"

#include "platform/core/ASCIICase.h"
#include "tool/shared/arguments/Nearest.h"
#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/arguments/Verb.h"
#include "tool/shared/input/FolderWalk.h"
#include "tool/shared/library/QueryValues.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <algorithm>
#include <filesystem>
#include <span>
#include <utility>

namespace {

std::string shownValue(const std::string& text)
{
    return "\"" + printable(text) + "\"";
}

// Adds an option whose value `read` takes from its text, or returns none.
template <class Read, class Take>
Argument addValue(Verb& verb, const std::string& name, const std::string& label, Read read, Take take,
                  const std::string& description, const std::string& expected)
{
    const auto problem = [read, expected](const std::string& text) {
        return read(text) ? "" : fmt::format("{} is no {}", shownValue(text), expected);
    };
    return verb
        .addText(
            name,
            [read, take](const std::string& text) {
                if (auto value = read(text))
                    take(std::move(*value));
            },
            description, problem)
        .label(label);
}

// A word that stands for several values.
struct Choice {
    std::string_view word;
    std::vector<std::string> meant;
    bool isCoding = false; // else a container
};

const Choice* choiceOf(std::span<const Choice> choices, const std::string& text)
{
    const auto found =
        std::ranges::find_if(choices, [&](const Choice& choice) { return equalIgnoringASCIICase(choice.word, text); });
    return found != choices.end() ? &*found : nullptr;
}

std::string problemOfChoice(std::span<const Choice> choices, const std::string& text, std::string_view what,
                            std::string_view examples)
{
    if (choiceOf(choices, text) != nullptr)
        return {};
    std::vector<std::string_view> words;
    for (const Choice& choice : choices)
        words.push_back(choice.word);
    const std::string nearest = didYouMean(text, words);
    return fmt::format("{} is no {}{}{} {}", shownValue(text), what, nearest, nearest.empty() ? ";" : "", examples);
}

Argument addChoice(Verb& verb, const std::string& name, const std::string& label, std::span<const Choice> choices,
                   std::function<void(const Choice&)> take, const std::string& description, std::string_view what,
                   std::string_view examples)
{
    return verb
        .addText(
            name,
            [choices, take](const std::string& text) {
                if (const Choice* const choice = choiceOf(choices, text))
                    take(*choice);
            },
            description, [=](const std::string& text) { return problemOfChoice(choices, text, what, examples); })
        .label(label);
}

std::span<const Choice> formatChoices()
{
    static const std::vector<Choice> choices = {{"wav", {"WAVE", "RF64", "BW64"}},
                                                {"wave", {"WAVE", "RF64", "BW64"}},
                                                {"rf64", {"RF64"}},
                                                {"bw64", {"BW64"}},
                                                {"w64", {"Wave64"}},
                                                {"wave64", {"Wave64"}},
                                                {"aiff", {"AIFF", "AIFC"}},
                                                {"aif", {"AIFF", "AIFC"}},
                                                {"aifc", {"AIFC"}},
                                                {"caf", {"CAF"}},
                                                {"rex2", {"REX2"}},
                                                {"rx2", {"REX2"}},
                                                {"mp3", {"MP3"}},
                                                {"mp2", {"MP2"}},
                                                {"aac", {"AAC", "AAC in ADIF"}},
                                                {"m4a", {"M4A"}},
                                                {"mp4", {"MP4", "M4A"}},
                                                {"flac", {"FLAC"}},
                                                {"ogg", {"Ogg"}},
                                                {"wma", {"WMA"}},
                                                {"wavpack", {"WavPack"}},
                                                {"wv", {"WavPack"}},
                                                {"ape", {"APE"}},
                                                {"au", {"AU"}},
                                                {"ac3", {"AC-3"}},
                                                {"eac3", {"E-AC-3"}},
                                                {"dts", {"DTS"}},
                                                {"tta", {"TTA"}},
                                                {"tak", {"TAK"}},
                                                {"matroska", {"Matroska"}},
                                                {"mka", {"Matroska"}},
                                                {"musepack", {"Musepack"}},
                                                {"mpc", {"Musepack"}},
                                                {"dsf", {"DSF"}},
                                                {"dff", {"DFF"}},
                                                {"voc", {"VOC"}},
                                                {"amr", {"AMR"}},
                                                {"opus", {"Opus"}, true},
                                                {"vorbis", {"Vorbis"}, true},
                                                {"alac", {"ALAC"}, true}};
    return choices;
}

std::span<const Choice> kindChoices()
{
    static const std::vector<Choice> choices = {{"loop", {"loop"}},           {"loops", {"loop"}},
                                                {"one-shot", {"one-shot"}},   {"one-shots", {"one-shot"}},
                                                {"oneshot", {"one-shot"}},    {"one shot", {"one-shot"}},
                                                {"recording", {"recording"}}, {"recordings", {"recording"}}};
    return choices;
}

// The kinds of `info --check`, and words for several of them.
std::span<const Choice> problemChoices()
{
    static const std::vector<Choice> choices = [] {
        std::vector<Choice> all = {{"any", {}}, {"truncated", {"soundIsCut", "containerIsCut", "chunkIsCut"}}};
        for (const std::string_view kind :
             {"unreadable",       "soundIsCut",        "containerIsCut", "bytesBehind",     "chunkBehind",
              "chunkReachesOut",  "chunkIsShort",      "idIsNoName",     "chunkIsCut",      "sizeIsOpen",
              "countIsOpen",      "noChunk",           "padIsMissing",   "padIsNotZero",    "repeated",
              "formatIsLate",     "formatIsMissing",   "formatIsWrong",  "soundIsMissing",  "soundIsUneven",
              "framesDiffer",     "sizes64AreMissing", "sizes64Differ",  "byteRateDiffers", "factIsMissing",
              "versionIsMissing", "offsetIsWrong",     "tableIsShort",   "digestIsWrong",   "digestDiffers",
              "documentIsBroken", "tracksDiffer"})
            all.push_back({kind, {std::string(kind)}});
        return all;
    }();
    return choices;
}

using Order = LibraryQuery::Order;

std::span<const std::pair<std::string_view, Order>> orderWords()
{
    static constexpr std::pair<std::string_view, Order> kOrders[] = {
        {"name", Order::name},         {"path", Order::path},
        {"tempo", Order::tempo},       {"key", Order::key},
        {"duration", Order::duration}, {"size", Order::size},
        {"modified", Order::modified}, {"category", Order::category},
        {"rate", Order::rate},         {"relevance", Order::relevance}};
    return kOrders;
}

std::optional<Order> orderFromText(const std::string& text)
{
    const auto found = std::ranges::find_if(
        orderWords(), [&](const auto& order) { return equalIgnoringASCIICase(order.first, text); });
    return found != orderWords().end() ? std::optional(found->second) : std::nullopt;
}

std::string problemOfOrder(const std::string& text)
{
    if (orderFromText(text))
        return {};
    std::vector<std::string_view> words;
    for (const auto& order : orderWords())
        words.push_back(order.first);
    const std::string nearest = didYouMean(text, words);
    return fmt::format("{} is no order{}{} {} are", shownValue(text), nearest, nearest.empty() ? ";" : "",
                       fmt::join(words, ", "));
}

void addMusicOptions(Verb& verb, LibraryQuery& query)
{
    addValue(
        verb, "--tempo", "BPM", tempoFromText, [&](NumberRange range) { query.tempos.push_back(range); },
        "Of that tempo, to the next whole beat per minute, or in a range: 118..122, ..90, 140..",
        "tempo: 120, 118..122, ..90 or 140.. is one");
    addValue(
        verb, "--key", "KEY", keyFromText, [&](KeyChoice key) { query.keys.push_back(std::move(key)); },
        "In that key: \"F# minor\", Gbm, F#, minor", "key: \"F# minor\", Gbm, Bb, or major is one");
    verb.addFlag("--related", query.takesRelated, "Relative and parallel keys too, and tempos half and twice as fast");
    addChoice(
        verb, "--kind", "KIND", kindChoices(), [&](const Choice& choice) { query.kind = choice.meant.front(); },
        "loop, one-shot or recording", "kind", "loop, one-shot or recording is one");
    verb.addText("--category", query.category, "Of that instrument category or sub-category").label("NAME");
    verb.addText("--genre", query.genre, "Of that genre").label("NAME");
    verb.addText("--artist", query.artist, "By that artist").label("NAME");
    verb.addText("--title", query.title, "Of that title").label("NAME");
    verb.addText("--album", query.album, "Of that album").label("NAME");
}

void addSoundOptions(Verb& verb, LibraryQuery& query)
{
    const auto seconds = [&query]() -> NumberRange& {
        return query.seconds ? *query.seconds : query.seconds.emplace();
    };
    constexpr const char* kTime = "time: 500ms, 2s, 1:30 or 2min is one";
    addValue(
        verb, "--longer", "TIME", secondsFromText, [=](double least) { seconds().least = least; },
        "At least that long: 500ms, 2s, 1:30", kTime);
    addValue(
        verb, "--shorter", "TIME", secondsFromText, [=](double most) { seconds().most = most; }, "At most that long",
        kTime);
    addValue(
        verb, "--rate", "HZ", [](const std::string& text) { return rangeFromText(text, rateFromText); },
        [&](NumberRange range) { query.sampleRate = range; }, "Of that sample rate, or in a range: 44.1k, 48k..96k",
        "sample rate: 48k, 44100 or 48k..96k is one");
    addValue(
        verb, "--channels", "N", [](const std::string& text) { return rangeFromText(text, plainNumberFromText); },
        [&](NumberRange range) { query.channels = range; }, "Of so many channels, or in a range: 2, 3..",
        "number of channels: 2, or 3.. is one");
    addChoice(
        verb, "--format", "FORMAT", formatChoices(),
        [&](const Choice& choice) { (choice.isCoding ? query.codings : query.containers) = choice.meant; },
        "wav, aiff, caf, mp3, m4a, flac, ogg, opus, and others", "format",
        "wav, aiff, aifc, caf, mp3, aac, m4a, flac, ogg, opus, wma, wavpack, w64 are some");
    addChoice(
        verb, "--problem", "KIND", problemChoices(),
        [&](const Choice& choice) {
            query.takesAnyProblem = choice.meant.empty();
            query.problems = choice.meant;
        },
        "With that problem: truncated, unreadable, a kind that info --check names, or any", "problem",
        "any, truncated, unreadable, or a kind that info --check names, such as soundIsCut, is one");
}

void addOrderOptions(Verb& verb, LibraryQuery& query)
{
    verb.addFlag("--duplicates", query.takesDuplicates,
                 "Files with the sound of another one, together; of indexes made with --hash");
    addValue(
        verb, "--since", "TIME", sinceFromText, [&](std::int64_t since) { query.modifiedSince = since; },
        "Changed since then: today, yesterday, 3d, 2w, 2026-11-01",
        "time: today, yesterday, 12h, 3d, 2w, 2026-11-01 or 2026-11-01T12:30 is one");
    verb.addText(
            "--sort", [&](const std::string& text) { query.order = orderFromText(text); },
            "Order by name, path, tempo, key, duration, size, modified, category, rate or relevance", problemOfOrder)
        .label("WHAT");
    verb.addFlag("--reverse", query.isReversed, "The other way round");
    verb.addNumber("--limit", query.limit, {0, 1'000'000'000}, "At most N files; 0 for all");
}

bool namesFolder(const std::string& word)
{
    std::error_code error;
    return std::filesystem::is_directory(word, error);
}

// A folder that is gone is taken for where its name says, since the index may know it.
LibraryQuery::Scope scopeNamed(const std::string& word)
{
    namespace fs = std::filesystem;
    std::error_code error;
    fs::path path = fs::canonical(word, error);
    if (error)
        path = fs::absolute(word, error).lexically_normal();
    const auto withSlash = [](std::string text) { return text.ends_with('/') ? text : text + '/'; };
    return {withSlash(path.string()), withSlash(word)};
}

} // namespace

void addQueryOptions(Verb& verb, LibraryQuery& query)
{
    verb.addTexts("WORD", query.words, "A folder to look in, and what the names, folders and texts of files have");
    addMusicOptions(verb, query);
    addSoundOptions(verb, query);
    addOrderOptions(verb, query);
}

void settleWords(LibraryQuery& query)
{
    for (const std::string& word : std::exchange(query.words, {})) {
        const bool hasSlash = word.find('/') != word.npos || word == "." || word == "..";
        const bool isFirst = query.scopes.empty() && query.terms.empty();
        if (word.ends_with('/') || ((hasSlash || isFirst) && namesFolder(word)))
            query.scopes.push_back(scopeNamed(word));
        else
            query.terms.push_back(word);
    }
    for (const std::string& term : query.terms)
        if (std::ranges::none_of(term, [](char c) {
                return (c >= '0' && c <= '9') || (asciiLower(c) >= 'a' && asciiLower(c) <= 'z') || (c & 0x80) != 0;
            }))
            throw UsageError(fmt::format("{} has no letter or digit to look for", shownValue(term)));
    if (query.takesRelated && query.keys.empty() && query.tempos.empty())
        throw UsageError("--related needs --key or --tempo");
    if (query.seconds && query.seconds->least > query.seconds->most)
        throw UsageError("--longer is more than --shorter");
    if (query.order == Order::relevance && query.terms.empty())
        throw UsageError("--sort relevance needs words to look for");
}
