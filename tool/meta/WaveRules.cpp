// Sets fields of "cart", "acid" and "smpl".
#include "audiofile/metadata/AcidChunk.h"
#include "audiofile/metadata/CartChunk.h"
#include "audiofile/metadata/SamplerChunk.h"
#include "tool/meta/ChunkFields.h"
#include "tool/meta/CueReferences.h"
#include "tool/meta/MetaEdit.h"

#include <fmt/format.h>

#include <array>
#include <cmath>
#include <limits>

namespace {

// The new chunk for a file without one.

CartChunk freshOf(const MetaEdit&, const CartChunk*)
{
    CartChunk cart;
    cart.version.set("0101");
    return cart;
}

AcidChunk freshOf(const MetaEdit&, const AcidChunk*)
{
    AcidChunk acid;
    acid.unknown = 0x8000; // as other programs write it
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

template <class Chunk, auto member>
void set(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<Chunk>(edit, step, [&](Chunk& chunk) { assign(chunk.*member, step); });
}

template <auto member>
constexpr auto setCart = set<CartChunk, member>;
template <auto member>
constexpr auto setAcid = set<AcidChunk, member>;
template <auto member>
constexpr auto setSampler = set<SamplerChunk, member>;

// "cart".

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

// "acid".

/// A flag tells whether the root note is valid.
void setAcidRoot(MetaEdit& edit, const MetaStep& step)
{
    changeChunk<AcidChunk>(edit, step, [&](AcidChunk& acid) {
        assign(acid.rootNote, step);
        if (edit.names(step.sibling("flags")))
            return;
        acid.flags = step.isRemoval() ? acid.flags & ~std::uint32_t{AcidChunk::kRootNoteSet}
                                      : acid.flags | AcidChunk::kRootNoteSet;
    });
}

// "smpl".

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
            std::uint32_t id = 0; // of a point that could be made for it alone
            for (const SamplerLoop& each : sampler.loops)
                id = std::max<std::uint32_t>(id, each.cueId + 1);
            sampler.loops.emplace_back().cueId = freeCueId(edit, id);
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

// "MD5 ".

/// Stored in reverse order, as a little-endian number.
void setDigest(MetaEdit& edit, const MetaStep& step)
{
    const auto* const digest = std::get_if<Bytes>(&step.value);
    if (digest == nullptr)
        return removeChunk<fourCC("MD5 ")>(edit, step);
    const Bytes body(digest->rbegin(), digest->rend());
    MetaChunk* const chunk = edit.chunkOf(step, fourCC("MD5 "));
    if (chunk == nullptr)
        edit.add(fourCC("MD5 "), body);
    else if (chunk->body != body)
        edit.replace(*chunk, body);
}

using K = MetaKind;

constexpr MetaRule kWaveRules[] = {
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
    {"cart.tagText", K::ascii, kAnyLength, setTagText},
    {"cart", K::none, {}, removeChunk<fourCC("cart")>},

    {"acid.flags", K::integer, kUnsigned32, setAcid<&AcidChunk::flags>},
    {"acid.rootNote", K::integer, {0, 127}, setAcidRoot},
    {"acid.beats", K::integer, kUnsigned32, setAcid<&AcidChunk::beats>},
    {"acid.meterNumerator", K::integer, kUnsigned16, setAcid<&AcidChunk::meterNumerator>},
    {"acid.meterDenominator", K::integer, kUnsigned16, setAcid<&AcidChunk::meterDenominator>},
    {"acid.tempo", K::decimal, {0, 10000}, setAcid<&AcidChunk::tempo>},
    {"acid", K::none, {}, removeChunk<fourCC("acid")>},

    {"smpl.manufacturer", K::integer, kUnsigned32, setSampler<&SamplerChunk::manufacturer>},
    {"smpl.product", K::integer, kUnsigned32, setSampler<&SamplerChunk::product>},
    {"smpl.samplePeriod", K::integer, kUnsigned32, setSampler<&SamplerChunk::samplePeriod>},
    {"smpl.midiUnityNote", K::integer, {0, 127}, setSampler<&SamplerChunk::midiUnityNote>},
    {"smpl.midiPitchFraction", K::integer, kUnsigned32, setSampler<&SamplerChunk::midiPitchFraction>},
    {"smpl.smpteFormat", K::integer, kUnsigned32, setSMPTEFormat},
    {"smpl.smpteOffset", K::smpteOffset, {}, setSampler<&SamplerChunk::smpteOffset>},
    {"smpl.loop[N].cueId", K::integer, kUnsigned32, setLoop<&SamplerLoop::cueId>},
    {"smpl.loop[N].type", K::loopType, {}, setLoop<&SamplerLoop::type>},
    {"smpl.loop[N].start", K::time, {}, setLoop<&SamplerLoop::start>, true},
    {"smpl.loop[N].end", K::time, {}, setLoop<&SamplerLoop::end>, true},
    {"smpl.loop[N].fraction", K::integer, kUnsigned32, setLoop<&SamplerLoop::fraction>},
    {"smpl.loop[N].playCount", K::integer, kUnsigned32, setLoop<&SamplerLoop::playCount>},
    {"smpl.loop[N]", K::none, {}, removeLoop},
    {"smpl", K::none, {}, removeChunk<fourCC("smpl")>},

    {"md5", K::digest, {}, setDigest},
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
    return kWaveRules;
}
