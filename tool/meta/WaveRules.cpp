// How fields of "bext", "cart", "acid" and "smpl" are set.
#include "audiofile/metadata/AcidChunk.h"
#include "audiofile/metadata/BroadcastExtension.h"
#include "audiofile/metadata/CartChunk.h"
#include "audiofile/metadata/SamplerChunk.h"
#include "tool/meta/MetaEdit.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <array>
#include <cmath>
#include <limits>

namespace {

constexpr double kMost16 = 65535, kMost32 = 4294967295.0, kNoLimit = 1e9;

// What a file gets that has no such chunk yet.

BroadcastExtension freshOf(const MetaEdit&, const BroadcastExtension*)
{
    BroadcastExtension bext;
    bext.version = 1;
    return bext;
}

CartChunk freshOf(const MetaEdit&, const CartChunk*)
{
    CartChunk cart;
    cart.version.set("0101");
    return cart;
}

AcidChunk freshOf(const MetaEdit&, const AcidChunk*)
{
    AcidChunk acid;
    acid.unknown = 0x8000; // as others write it
    return acid;
}

SamplerChunk freshOf(const MetaEdit& edit, const SamplerChunk*)
{
    constexpr double nanoseconds = 1e9;
    SamplerChunk sampler;
    sampler.midiUnityNote = 60; // middle C
    if (edit.file().sampleRate > 0)
        sampler.samplePeriod = static_cast<std::uint32_t>(std::lround(nanoseconds / edit.file().sampleRate));
    return sampler;
}

template <class Chunk>
constexpr FourCC kIdOf = 0;
template <>
constexpr FourCC kIdOf<BroadcastExtension> = fourCC("bext");
template <>
constexpr FourCC kIdOf<CartChunk> = fourCC("cart");
template <>
constexpr FourCC kIdOf<AcidChunk> = fourCC("acid");
template <>
constexpr FourCC kIdOf<SamplerChunk> = fourCC("smpl");

template <class Chunk, class Change>
void changeChunk(MetaEdit& edit, const MetaStep& step, Change change)
{
    edit.change(step, kIdOf<Chunk>, freshOf(edit, static_cast<Chunk*>(nullptr)), change);
}

template <std::size_t size>
void assign(FixedText<size>& field, const MetaStep& step)
{
    field.set(step.string()); // its rule knows the size
}

template <class T>
void assign(Packed<T>& field, const MetaStep& step)
{
    if constexpr (std::is_floating_point_v<T>)
        field = static_cast<T>(step.decimal());
    else
        field = static_cast<T>(step.number());
}

template <class Chunk, auto member>
void set(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<Chunk>(edit, step, [&](Chunk& chunk) { assign(chunk.*member, step); });
}

template <auto member>
constexpr auto setBext = set<BroadcastExtension, member>;
template <auto member>
constexpr auto setCart = set<CartChunk, member>;
template <auto member>
constexpr auto setAcid = set<AcidChunk, member>;
template <auto member>
constexpr auto setSampler = set<SamplerChunk, member>;

// "bext":

constexpr std::array kLoudness{&BroadcastExtension::loudnessValue, &BroadcastExtension::loudnessRange,
                               &BroadcastExtension::maxTruePeakLevel, &BroadcastExtension::maxMomentaryLoudness,
                               &BroadcastExtension::maxShortTermLoudness};
constexpr std::array<std::string_view, kLoudness.size()> kLoudnessNames{
    "loudnessValue", "loudnessRange", "maxTruePeakLevel", "maxMomentaryLoudness", "maxShortTermLoudness"};

/// Where fields were reserved bytes, which are zero, they are told to be unknown.
void raiseVersion(BroadcastExtension& bext, std::uint16_t version)
{
    const bool isNew =
        !bext.hasLoudness() && std::ranges::all_of(kLoudness, [&](auto each) { return bext.*each == 0; });
    if (version >= 2 && isNew)
        for (const auto each : kLoudness)
            bext.*each = BroadcastExtension::kNoLoudness;
    bext.version = version;
}

std::string sibling(const MetaStep& step, std::string_view name)
{
    return step.name.upTo(0) + "." + std::string(name);
}

/// Raised for a field that it does not have, unless it is named.
void requireVersion(const MetaEdit& edit, const MetaStep& step, BroadcastExtension& bext, std::uint16_t version)
{
    if (bext.version >= version)
        return;
    if (edit.names(sibling(step, "version")))
        MetaEdit::refuse(step, fmt::format("version {} of bext has no such field; it is in version {}",
                                           std::uint16_t{bext.version}, version));
    raiseVersion(bext, version);
}

/// A lower version has reserved bytes where fields were: they must be empty, or be named as well.
void setVersion(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<BroadcastExtension>(edit, step, [&](BroadcastExtension& bext) {
        const auto version = static_cast<std::uint16_t>(step.number());
        if (version >= bext.version)
            return raiseVersion(bext, version);
        for (std::size_t i = 0; i < kLoudness.size() && bext.hasLoudness() && version < 2; ++i) {
            const std::string name = sibling(step, kLoudnessNames[i]);
            if (bext.*kLoudness[i] != BroadcastExtension::kNoLoudness && !edit.names(name))
                MetaEdit::refuse(step, name + " is in version 2 only: remove it as well");
            bext.*kLoudness[i] = std::int16_t{0};
        }
        if (version < 1 && bext.hasUMID() && !edit.names(sibling(step, "umid")))
            MetaEdit::refuse(step, sibling(step, "umid") + " is in versions 1 and 2 only: remove it as well");
        if (version < 1)
            bext.umid = {};
        bext.version = version;
    });
}

template <std::size_t index>
void setLoudness(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<BroadcastExtension>(edit, step, [&](BroadcastExtension& bext) {
        if (step.isRemoval() && !bext.hasLoudness())
            return;
        requireVersion(edit, step, bext, 2);
        bext.*kLoudness[index] = step.isRemoval() ? std::int16_t{BroadcastExtension::kNoLoudness}
                                                  : static_cast<std::int16_t>(std::lround(step.decimal() * 100));
    });
}

void setUMID(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<BroadcastExtension>(edit, step, [&](BroadcastExtension& bext) {
        if (!step.isRemoval())
            requireVersion(edit, step, bext, 1);
        if (bext.version < 1)
            return;
        bext.umid = {};
        if (const auto* const umid = std::get_if<Bytes>(&step.value))
            std::ranges::copy(*umid, bext.umid.begin());
    });
}

void setTimeReference(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<BroadcastExtension>(edit, step, [&](BroadcastExtension& bext) {
        bext.setTimeReference(edit.framesOf(step, std::numeric_limits<std::uint64_t>::max()));
    });
}

constexpr std::string_view kLineEnd = "\r\n";

/// Lines as the standard ends them.
std::string withLineEnds(std::string_view text)
{
    std::string lines;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find_first_of("\r\n"), text.size());
        if (end != 0)
            (lines += text.substr(0, end)) += kLineEnd;
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return lines;
}

void setHistory(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<BroadcastExtension>(
        edit, step, [&](BroadcastExtension& bext) { replaceText(bext.codingHistory, withLineEnds(step.string())); });
}

/// One line, counted as they are shown: those that are not empty. The others keep their ends, whatever those are.
void setHistoryLine(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<BroadcastExtension>(edit, step, [&](BroadcastExtension& bext) {
        std::string text(textOf(bext.codingHistory));
        text.resize(std::min(text.find('\0'), text.size()));
        std::vector<std::pair<std::size_t, std::size_t>> lines;
        for (std::size_t begin = 0; begin < text.size();) {
            const std::size_t end = std::min(text.find_first_of("\r\n", begin), text.size());
            if (end != begin)
                lines.emplace_back(begin, end - begin);
            begin = end + 1;
        }
        const auto index = edit.itemOf(step, 1, lines.size());
        if (!index)
            return;
        if (*index == lines.size()) {
            if (!text.empty() && text.back() != '\n' && text.back() != '\r')
                text += kLineEnd;
            (text += step.string()) += kLineEnd;
        } else if (step.isRemoval()) {
            const auto [begin, size] = lines[*index];
            const std::size_t next = *index + 1 < lines.size() ? lines[*index + 1].first : text.size();
            text.erase(begin, next - begin);
            edit.itemRemoved(step, 1);
        } else {
            text.replace(lines[*index].first, lines[*index].second, step.string());
        }
        replaceText(bext.codingHistory, text);
    });
}

// "cart":

template <bool isUsage>
void setTimer(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<CartChunk>(edit, step, [&](CartChunk& cart) {
        const auto index = step.name.parts[1].number();
        if (!index || *index >= cart.postTimers.size())
            MetaEdit::refuse(step, fmt::format("there are {} timers, timer[0] to timer[{}]", cart.postTimers.size(),
                                               cart.postTimers.size() - 1));
        if (isUsage)
            cart.postTimers[*index].usage = static_cast<FourCC>(step.number());
        else
            cart.postTimers[*index].value = static_cast<std::uint32_t>(edit.framesWithinSound(step));
    });
}

void removeTimer(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<CartChunk>(edit, step, [&](CartChunk& cart) {
        if (const auto index = step.name.parts[1].number(); index && *index < cart.postTimers.size())
            cart.postTimers[*index] = {};
    });
}

void setTagText(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<CartChunk>(edit, step, [&](CartChunk& cart) { replaceText(cart.tagText, step.string()); });
}

// "acid":

/// A root note counts when a flag says so.
void setAcidRoot(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<AcidChunk>(edit, step, [&](AcidChunk& acid) {
        assign(acid.rootNote, step);
        if (edit.names(sibling(step, "flags")))
            return;
        acid.flags = step.isRemoval() ? acid.flags & ~std::uint32_t{AcidChunk::kRootNoteSet}
                                      : acid.flags | AcidChunk::kRootNoteSet;
    });
}

// "smpl":

void setSMPTEFormat(MetaEdit& edit, const MetaStep& step)
{
    constexpr std::array<std::int64_t, 5> formats{0, 24, 25, 29, 30};
    if (std::ranges::find(formats, step.number()) == formats.end() && !edit.isLenient())
        MetaEdit::refuse(step, "0, 24, 25, 29 or 30 frames a second expected; --lenient writes others");
    set<SamplerChunk, &SamplerChunk::smpteFormat>(edit, step);
}

template <auto member>
void setLoop(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<SamplerChunk>(edit, step, [&](SamplerChunk& sampler) {
        const auto index = edit.itemOf(step, 1, sampler.loops.size());
        if (!index)
            return;
        if (*index == sampler.loops.size()) {
            const std::string loop = step.name.upTo(1);
            if (!edit.names(loop + ".start") || !edit.names(loop + ".end"))
                MetaEdit::refuse(step, "a new loop needs its start and its end");
            if (sampler.missingLoops != 0)
                MetaEdit::refuseDamaged(fourCC("smpl"));
            sampler.loops.emplace_back();
            std::uint32_t id = 0;
            for (const SamplerLoop& each : sampler.loops)
                id = std::max<std::uint32_t>(id, each.cueId + 1);
            sampler.loops.back().cueId = sampler.loops.size() == 1 ? 0U : id;
        }
        SamplerLoop& each = sampler.loops[*index];
        if (std::holds_alternative<MetaTime>(step.value))
            each.*member = static_cast<std::uint32_t>(edit.framesWithinSound(step));
        else
            assign(each.*member, step);
    });
}

void removeLoop(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<SamplerChunk>(edit, step, [&](SamplerChunk& sampler) {
        const auto index = edit.itemOf(step, 1, sampler.loops.size());
        if (!index)
            return;
        if (sampler.missingLoops != 0)
            MetaEdit::refuseDamaged(fourCC("smpl"));
        sampler.loops.erase(sampler.loops.begin() + static_cast<std::ptrdiff_t>(*index));
        edit.itemRemoved(step, 1);
    });
}

using K = MetaKind;

constexpr MetaRule kRules[] = {
    {"bext.description", K::ascii, {0, 256}, setBext<&BroadcastExtension::description>},
    {"bext.originator", K::line, {0, 32}, setBext<&BroadcastExtension::originator>},
    {"bext.originatorReference", K::line, {0, 32}, setBext<&BroadcastExtension::originatorReference>},
    {"bext.originationDate", K::date, {}, setBext<&BroadcastExtension::originationDate>},
    {"bext.originationTime", K::clock, {}, setBext<&BroadcastExtension::originationTime>},
    {"bext.timeReference", K::time, {}, setTimeReference},
    {"bext.version", K::integer, {0, 2}, setVersion},
    {"bext.umid", K::umid, {}, setUMID},
    {"bext.loudnessValue", K::decimal, {-99.99, 99.99}, setLoudness<0>},
    {"bext.loudnessRange", K::decimal, {0, 99.99}, setLoudness<1>},
    {"bext.maxTruePeakLevel", K::decimal, {-99.99, 99.99}, setLoudness<2>},
    {"bext.maxMomentaryLoudness", K::decimal, {-99.99, 99.99}, setLoudness<3>},
    {"bext.maxShortTermLoudness", K::decimal, {-99.99, 99.99}, setLoudness<4>},
    {"bext.codingHistory", K::ascii, {0, kNoLimit}, setHistory},
    {"bext.codingHistory[N]", K::line, {0, kNoLimit}, setHistoryLine},
    {"bext", K::none, {}, removeChunk<fourCC("bext")>},

    {"cart.version", K::line, {0, 4}, setCart<&CartChunk::version>},
    {"cart.title", K::line, {0, 64}, setCart<&CartChunk::title>},
    {"cart.artist", K::line, {0, 64}, setCart<&CartChunk::artist>},
    {"cart.cutId", K::line, {0, 64}, setCart<&CartChunk::cutId>},
    {"cart.clientId", K::line, {0, 64}, setCart<&CartChunk::clientId>},
    {"cart.category", K::line, {0, 64}, setCart<&CartChunk::category>},
    {"cart.classification", K::line, {0, 64}, setCart<&CartChunk::classification>},
    {"cart.outCue", K::line, {0, 64}, setCart<&CartChunk::outCue>},
    {"cart.startDate", K::date, {}, setCart<&CartChunk::startDate>},
    {"cart.startTime", K::clock, {}, setCart<&CartChunk::startTime>},
    {"cart.endDate", K::date, {}, setCart<&CartChunk::endDate>},
    {"cart.endTime", K::clock, {}, setCart<&CartChunk::endTime>},
    {"cart.producerAppId", K::line, {0, 64}, setCart<&CartChunk::producerAppId>},
    {"cart.producerAppVersion", K::line, {0, 64}, setCart<&CartChunk::producerAppVersion>},
    {"cart.userDef", K::line, {0, 64}, setCart<&CartChunk::userDef>},
    {"cart.levelReference", K::integer, {-2147483648.0, 2147483647}, setCart<&CartChunk::levelReference>},
    {"cart.timer[N].usage", K::id, {}, setTimer<true>},
    {"cart.timer[N].position", K::time, {}, setTimer<false>},
    {"cart.timer[N]", K::none, {}, removeTimer},
    {"cart.url", K::line, {0, 1024}, setCart<&CartChunk::url>},
    {"cart.tagText", K::ascii, {0, kNoLimit}, setTagText},
    {"cart", K::none, {}, removeChunk<fourCC("cart")>},

    {"acid.flags", K::integer, {0, kMost32}, setAcid<&AcidChunk::flags>},
    {"acid.rootNote", K::integer, {0, 127}, setAcidRoot},
    {"acid.beats", K::integer, {0, kMost32}, setAcid<&AcidChunk::beats>},
    {"acid.meterNumerator", K::integer, {0, kMost16}, setAcid<&AcidChunk::meterNumerator>},
    {"acid.meterDenominator", K::integer, {0, kMost16}, setAcid<&AcidChunk::meterDenominator>},
    {"acid.tempo", K::decimal, {0, 10000}, setAcid<&AcidChunk::tempo>},
    {"acid", K::none, {}, removeChunk<fourCC("acid")>},

    {"smpl.manufacturer", K::integer, {0, kMost32}, setSampler<&SamplerChunk::manufacturer>},
    {"smpl.product", K::integer, {0, kMost32}, setSampler<&SamplerChunk::product>},
    {"smpl.samplePeriod", K::integer, {0, kMost32}, setSampler<&SamplerChunk::samplePeriod>},
    {"smpl.midiUnityNote", K::integer, {0, 127}, setSampler<&SamplerChunk::midiUnityNote>},
    {"smpl.midiPitchFraction", K::integer, {0, kMost32}, setSampler<&SamplerChunk::midiPitchFraction>},
    {"smpl.smpteFormat", K::integer, {0, kMost32}, setSMPTEFormat},
    {"smpl.smpteOffset", K::smpteOffset, {}, setSampler<&SamplerChunk::smpteOffset>},
    {"smpl.loop[N].cueId", K::integer, {0, kMost32}, setLoop<&SamplerLoop::cueId>},
    {"smpl.loop[N].type", K::loopType, {}, setLoop<&SamplerLoop::type>},
    {"smpl.loop[N].start", K::time, {}, setLoop<&SamplerLoop::start>},
    {"smpl.loop[N].end", K::time, {}, setLoop<&SamplerLoop::end>},
    {"smpl.loop[N].fraction", K::integer, {0, kMost32}, setLoop<&SamplerLoop::fraction>},
    {"smpl.loop[N].playCount", K::integer, {0, kMost32}, setLoop<&SamplerLoop::playCount>},
    {"smpl.loop[N]", K::none, {}, removeLoop},
    {"smpl", K::none, {}, removeChunk<fourCC("smpl")>},
};

} // namespace

void checkLoop(MetaEdit& edit, const MetaStep& step)
{
    const MetaChunk* const chunk = edit.chunkOf(step, fourCC("smpl"));
    const auto sampler = chunk != nullptr ? SamplerChunk::read(chunk->body) : std::nullopt;
    const auto index = sampler ? edit.itemOf(step, 1, sampler->loops.size()) : std::nullopt;
    if (!index || edit.isLenient())
        return;
    const SamplerLoop& loop = sampler->loops[*index];
    if (loop.end < loop.start || (edit.file().frames >= 0 && std::int64_t{loop.end} >= edit.file().frames))
        MetaEdit::refuse(step, fmt::format("its frames would be {} to {} of {}; --lenient writes them",
                                           std::uint32_t{loop.start}, std::uint32_t{loop.end}, edit.file().frames));
}

std::span<const MetaRule> waveRules()
{
    return kRules;
}
