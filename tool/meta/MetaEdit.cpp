#include "tool/meta/MetaEdit.h"

#include "audiofile/metadata/InfoList.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/core/ASCIICase.h"
#include "tool/shared/arguments/Nearest.h"
#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <limits>

namespace {

/// Items are removed from last to first, so that earlier indices stay valid; an item's fields are removed before it.
bool goesBefore(const MetaStep& a, const MetaStep& b)
{
    const auto isVersion = [](const MetaStep& step) { return step.name.rest == "version"; };
    if (a.isRemoval() != b.isRemoval())
        return b.isRemoval();
    if (!a.isRemoval())
        return isVersion(a) && !isVersion(b); // other fields depend on the version
    const std::size_t shared = std::min(a.name.parts.size(), b.name.parts.size());
    for (std::size_t i = 0; i < shared; ++i)
        if (const auto left = a.name.parts[i].number(), right = b.name.parts[i].number(); left != right)
            return left > right;
    return a.name.parts.size() > b.name.parts.size();
}

/// As typed; a long text is shortened.
std::string inWords(const std::string& name, const std::optional<std::string>& text)
{
    constexpr std::size_t most = 60;
    if (!text)
        return printable(name);
    std::size_t end = std::min(text->size(), most);
    while (end < text->size() && (static_cast<unsigned char>((*text)[end]) & 0xC0) == 0x80)
        ++end; // do not cut a character
    return fmt::format("{}={}{}", printable(name), printable(text->substr(0, end)), end < text->size() ? "…" : "");
}

using RuleLists = std::vector<std::span<const MetaRule>>;

RuleLists rulesOf(FourCC container)
{
    switch (container) {
    case kFORM:
        return {aiffRules()};
    case kCaff:
        return {cafRules()};
    default:
        return {bextRules(), infoRules(), xmlRules(), cueRules(), waveRules()};
    }
}

/// In these groups brackets name an item, in others one of several chunks.
bool isList(std::string_view group)
{
    constexpr std::array<std::string_view, 4> lists{"cue", "comt", "mark", "strg"};
    return std::ranges::find(lists, group) != lists.end();
}

/// Throws UsageError for brackets that are invalid in every file. Keys of CAF may contain any.
void requireIndices(const MetaName& name, bool isRemoval)
{
    constexpr std::array<std::string_view, 4> texts{"NAME", "AUTH", "(c)", "ANNO"}; // several chunks are possible
    const std::string& group = name.group();
    for (const MetaName::Part& part : name.parts) {
        const bool isFirst = &part == &name.parts.front();
        if (group == "info" || part.number() || (isFirst && group == "cue" && part.id()))
            continue;
        const bool takesNew =
            !isRemoval && (!isFirst || isList(group) || std::ranges::find(texts, group) != texts.end());
        if (!(part.isNew() && takesNew))
            throw UsageError(fmt::format("{}: \"{}\" is no index here; [0] is the first{}", printable(name.text),
                                         printable(part.index), takesNew ? ", [new] one behind the last" : ""));
    }
}

constexpr std::array kContainers{fourCC("RIFF"), kFORM, kCaff};

std::vector<std::string_view> knownPatterns()
{
    std::vector<std::string_view> known;
    for (const FourCC container : kContainers)
        for (const auto& rules : rulesOf(container))
            for (const MetaRule& rule : rules)
                if (!rule.pattern.ends_with('*'))
                    known.push_back(rule.pattern);
    return known;
}

template <class T>
T valueOr0(const MetaValue& value)
{
    const T* const found = std::get_if<T>(&value);
    return found != nullptr ? *found : T();
}

} // namespace

std::string MetaStep::string() const
{
    return valueOr0<std::string>(value);
}

std::int64_t MetaStep::number() const
{
    return valueOr0<std::int64_t>(value);
}

double MetaStep::decimal() const
{
    return valueOr0<double>(value);
}

MetaEdit::MetaEdit(HeldMetadata& held, const std::vector<MetaStep>& steps, bool isLenient, bool makesNext)
    : held_(held),
      steps_(steps),
      isLenient_(isLenient),
      makesNext_(makesNext)
{
}

void MetaEdit::apply()
{
    std::vector<const MetaRule*> rules;
    for (MetaStep& step : steps_) {
        const MetaRule* const rule = ruleFor(step.name, held_.container);
        if (rule == nullptr)
            throw Failure(fmt::format("{} is no field of {} files", printable(step.name.text),
                                      held_.container == kFORM   ? "AIFF"
                                      : held_.container == kCaff ? "CAF"
                                                                 : "WAVE"));
        if (step.isRemoval() && rule->isAlwaysThere)
            refuse(step, fmt::format("it is always there; what goes is {}",
                                     step.name.text.substr(0, step.name.text.rfind('.'))));
        try {
            if (step.text && !step.text->empty())
                step.value = metaValueFromText(rule->kind, rule->range, *step.text, isLenient_);
        } catch (const UsageError& error) { // another container may accept it
            refuse(step, error.what());
        }
    }
    std::ranges::stable_sort(steps_, goesBefore);
    for (const MetaStep& step : steps_)
        ruleFor(step.name, held_.container)->apply(*this, step);
    for (const MetaStep& step : steps_)
        if (step.name.group() == "smpl" && step.name.parts.size() == 3 && !step.isRemoval())
            checkLoop(*this, step);
}

bool MetaEdit::names(std::string_view field) const
{
    return std::ranges::any_of(steps_, [field](const MetaStep& step) { return step.name.text == field; });
}

MetaChunk* MetaEdit::find(FourCC id, std::size_t index, FourCC form)
{
    for (MetaChunk& chunk : held_.source.chunks) {
        const bool isMeant =
            chunk.id == id &&
            (form == 0 || (chunk.body.size() >= sizeof form && loadBE<FourCC>(chunk.body.data()) == form));
        if (!isMeant || index-- != 0)
            continue;
        if (!chunk.isHeld)
            throw Failure(fmt::format("its chunk \"{}\" is too large to be edited by field", fourCCText(id)));
        if (std::ssize(chunk.body) != chunk.size)
            throw Failure(fmt::format("its chunk \"{}\" is cut short: {} of {} bytes are there", fourCCText(id),
                                      chunk.body.size(), chunk.size));
        return &chunk;
    }
    return nullptr;
}

MetaChunk& MetaEdit::add(FourCC id, Bytes body)
{
    touch(id);
    MetaChunk& chunk = held_.source.chunks.emplace_back();
    chunk.id = id;
    chunk.offset = nextOffset_--;
    chunk.size = std::ssize(body);
    chunk.body = std::move(body);
    return chunk;
}

void MetaEdit::replace(MetaChunk& chunk, Bytes body)
{
    touch(chunk.id);
    chunk.size = std::ssize(body);
    chunk.body = std::move(body);
}

void MetaEdit::remove(MetaChunk& chunk)
{
    touch(chunk.id);
    held_.source.chunks.erase(held_.source.chunks.begin() + (&chunk - held_.source.chunks.data()));
}

MetaChunk* MetaEdit::chunkOf(const MetaStep& step, FourCC id, FourCC form)
{
    const MetaName::Part& group = step.name.parts.front();
    const auto index = group.number();
    MetaChunk* const chunk = index ? find(id, *index, form) : nullptr;
    if (chunk == nullptr && !step.isRemoval() && index != 0U) {
        std::size_t count = 0;
        while (find(id, count, form) != nullptr)
            ++count;
        refuse(step, count == 0 ? fmt::format("it has no {0}; {0} without an index makes one", group.name)
                                : fmt::format("the last is {}[{}]", group.name, count - 1));
    }
    return chunk;
}

void MetaEdit::refuseDamaged(FourCC id)
{
    throw Failure(fmt::format("its chunk \"{}\" is damaged; chunks remove takes it off", fourCCText(id)));
}

std::optional<std::size_t> MetaEdit::itemOf(const MetaStep& step, std::size_t part, std::size_t count)
{
    const MetaName::Part& item = step.name.parts[part];
    if (item.isNew() && !step.isRemoval())
        return newItems_.try_emplace(step.name.upTo(part), count).first->second;
    const auto index = item.number();
    if (index && *index < count)
        return index;
    if (index == count && makesNext_ && !step.isRemoval())
        return index;
    if (step.isRemoval())
        return std::nullopt;
    if (!index)
        refuse(step, fmt::format("\"{}\" is no index; [0] is the first, [new] one behind the last", item.index));
    const std::string next = makesNext_ ? std::to_string(count) : "new";
    refuse(step, count == 0 ? fmt::format("there is none; [{}] adds one", next)
                            : fmt::format("the last is [{}]; [{}] adds one", count - 1, next));
}

void MetaEdit::itemRemoved(const MetaStep& step, std::size_t part)
{
    removedItems_.push_back(step.name.upTo(part));
}

std::uint64_t MetaEdit::framesOf(const MetaStep& step, std::uint64_t most) const
{
    const auto* const time = std::get_if<MetaTime>(&step.value);
    if (time == nullptr)
        return 0;
    if (!time->isFrames() && held_.sampleRate <= 0)
        refuse(step, "its sample rate is not known, and only frames can be set");
    const std::uint64_t frames = time->at(held_.sampleRate);
    if (frames > most)
        refuse(step, fmt::format("frame {} is more than {}", frames, most));
    return frames;
}

std::uint64_t MetaEdit::framesWithinSound(const MetaStep& step) const
{
    const std::uint64_t frames = framesOf(step, std::numeric_limits<std::uint32_t>::max());
    if (held_.frames >= 0 && frames > static_cast<std::uint64_t>(held_.frames) && !isLenient_)
        refuse(step,
               fmt::format("frame {}, but the sound ends at frame {}; --lenient writes it", frames, held_.frames));
    return frames;
}

void MetaEdit::refuse(const MetaStep& step, const std::string& why)
{
    throw Failure(fmt::format("{}: {}", inWords(step.name.text, step.text), why));
}

void MetaEdit::touch(FourCC id)
{
    if (std::ranges::find(touched_, id) == touched_.end())
        touched_.push_back(id);
}

const MetaRule* ruleFor(const MetaName& name, FourCC container)
{
    const std::string ofChunk = name.pattern(false), ofItem = isList(name.group()) ? name.pattern(true) : ofChunk;
    for (const auto& rules : rulesOf(container))
        for (const MetaRule& rule : rules) {
            const bool isOpen = rule.pattern.ends_with('*');
            const std::string_view fixed = rule.pattern.substr(0, rule.pattern.size() - (isOpen ? 1 : 0));
            if (isOpen ? !name.rest.empty() && ofChunk.starts_with(fixed) : rule.pattern == ofItem)
                return &rule;
        }
    return nullptr;
}

MetaStep metaStep(const std::string& name, const std::optional<std::string>& text, bool isLenient)
{
    const auto parsed = metaNameFromText(name);
    if (!parsed || !isEditedField(name))
        throw UsageError(fmt::format("there is no field \"{}\" to edit{}", printable(name), whyNotEdited(name)));
    requireIndices(*parsed, !text || text->empty());
    MetaStep step{*parsed, text, {}};
    if (!text || text->empty())
        return step;
    std::string why;
    for (const FourCC container : kContainers)
        if (const MetaRule* const rule = ruleFor(*parsed, container))
            try {
                step.value = metaValueFromText(rule->kind, rule->range, *text, isLenient);
                return step;
            } catch (const UsageError& error) {
                why = error.what();
            }
    throw UsageError(fmt::format("{}: {}", inWords(name, text), why));
}

bool isEditedField(const std::string& name)
{
    const auto parsed = metaNameFromText(name);
    return parsed && std::ranges::any_of(kContainers, [&](FourCC each) { return ruleFor(*parsed, each) != nullptr; });
}

std::string whyNotEdited(const std::string& name)
{
    const auto parsed = metaNameFromText(name);
    const std::vector<std::string_view> known = knownPatterns();
    for (const FourCC id : InfoList::knownIds())
        if (equalIgnoringASCIICase(fourCCText(id), name))
            return fmt::format(", did you mean \"info.{}\"?", fourCCText(id));
    if (parsed)
        if (const std::string nearest = didYouMean(parsed->pattern(true), known); !nearest.empty())
            return nearest;
    const std::string group = parsed ? parsed->group() : name;
    const auto isSame = [&](std::string_view other) { return equalIgnoringASCIICase(other, group); };
    const auto isOf = [&](std::string_view pattern) { return isSame(pattern.substr(0, pattern.find_first_of("[."))); };
    if (std::ranges::none_of(known, isOf) && std::ranges::any_of(MetadataGroupNames(), isSame))
        return ": " + group + " is only read";
    return "; they are those that meta prints of bext, info, ixml, cue, smpl, acid, cart, NAME, AUTH, (c), ANNO, comt, "
           "mark and strg";
}

void replaceText(Bytes& bytes, std::string_view text)
{
    const auto end = std::ranges::find(bytes, std::byte{0});
    const std::size_t before = bytes.size();
    const bool isFilled = std::all_of(end, bytes.end(), [](std::byte byte) { return byte == std::byte{0}; });
    Bytes after(bytesOf(text).begin(), bytesOf(text).end());
    if (isFilled)
        after.resize(std::max(after.size(), before));
    else
        after.insert(after.end(), end, bytes.end());
    bytes = std::move(after);
}
