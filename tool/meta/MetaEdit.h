// Edits of metadata by field, worked out in memory: rules say what a field is called, what it takes, and how it gets
// into its chunk, of which all else stays to the byte.
#pragma once

#include "audiofile/fields/FileMetadata.h"
#include "tool/meta/MetaNames.h"
#include "tool/meta/MetaValues.h"

#include <functional>

/// One field to set, or to remove.
struct MetaStep {
    MetaName name;
    std::optional<std::string> text; // as typed; none: to be removed
    MetaValue value;                 // the same as its rule wants it

    /// The name of another field of the same group: "bext[1].umid".
    std::string sibling(std::string_view field) const { return name.upTo(0) + "." + std::string(field); }
    bool isRemoval() const { return std::holds_alternative<std::monostate>(value); }
    /// Empty, and 0, of a removal.
    std::string string() const;
    std::int64_t number() const;
    double decimal() const;
};

/// The chunks of one file while steps are applied to them.
class MetaEdit {
public:
    /// The chunks that `held` has are changed. With `isLenient` what a standard does not allow is taken; with
    /// `makesNext` an index that is one beyond the last item stands for a new one, as `[new]` does.
    MetaEdit(HeldMetadata& held, const std::vector<MetaStep>& steps, bool isLenient, bool makesNext = false);

    /// Applies all of them, removals last. Throws Failure.
    void apply();

    /// Ids of the chunks that were changed, added or removed.
    const std::vector<FourCC>& touched() const { return touched_; }
    /// Names of what went by its index, so that what follows has other names now: "cue[1]".
    const std::vector<std::string>& removedItems() const { return removedItems_; }

    // For rules. They throw Failure for what the file does not allow.

    bool isLenient() const { return isLenient_; }
    const HeldMetadata& file() const { return held_; }
    /// Whether a step names this field.
    bool names(std::string_view field) const;

    /// The chunk of an id, and of a form when that is not 0, by its index among its like; null when there is none.
    MetaChunk* find(FourCC id, std::size_t index = 0, FourCC form = 0);
    MetaChunk& add(FourCC id, Bytes body);
    void replace(MetaChunk& chunk, Bytes body);
    void remove(MetaChunk& chunk);
    /// The chunk that a step's group means, by the number in its brackets: null for a new one. A removal goes on only
    /// where there is one.
    MetaChunk* chunkOf(const MetaStep& step, FourCC id, FourCC form = 0);

    /// Reads the chunk that the step's group means, or makes `fresh`, and writes what came of it.
    template <class Chunk, class Change>
    void change(const MetaStep& step, FourCC id, const Chunk& fresh, Change change)
    {
        MetaChunk* const chunk = chunkOf(step, id);
        if (chunk == nullptr && step.isRemoval())
            return;
        auto value = chunk != nullptr ? Chunk::read(chunk->body) : std::optional(fresh);
        if (!value)
            refuseDamaged(id);
        change(*value);
        if (chunk == nullptr)
            add(id, value->write());
        else if (Bytes body = value->write(); body != chunk->body)
            replace(*chunk, std::move(body));
    }
    [[noreturn]] static void refuseDamaged(FourCC id);

    /// The index of the item that a part of the name means among `count`: `count` itself for a new one, which the
    /// caller appends. None of a removal of what is not there.
    std::optional<std::size_t> itemOf(const MetaStep& step, std::size_t part, std::size_t count);
    /// The step took an item away by its index.
    void itemRemoved(const MetaStep& step, std::size_t part);

    /// A step's place or length in frames, at most `most`, which is beyond the end of the sound only when that is
    /// taken. 0 of a removal.
    std::uint64_t framesOf(const MetaStep& step, std::uint64_t most) const;
    std::uint64_t framesWithinSound(const MetaStep& step) const; // of 32 bits
    [[noreturn]] static void refuse(const MetaStep& step, const std::string& why);

private:
    void touch(FourCC id);

    HeldMetadata& held_;
    std::vector<MetaStep> steps_;
    bool isLenient_, makesNext_;
    std::int64_t nextOffset_ = -1; // tells new chunks from those of the file
    std::vector<FourCC> touched_;
    std::vector<std::string> removedItems_;
    std::map<std::string, std::size_t, std::less<>> newItems_;
};

struct MetaRule {
    std::string_view pattern; // "cue[N].label"; a "*" at the end stands for all that follows
    MetaKind kind = MetaKind::none;
    MetaRange range;
    void (*apply)(MetaEdit& edit, const MetaStep& step) = nullptr;
    bool isAlwaysThere = false; // goes only with the item that it is of
};

// By container, as readers are:
std::span<const MetaRule> bextRules(); // of WAVE, as the next four
std::span<const MetaRule> infoRules();
std::span<const MetaRule> xmlRules();
std::span<const MetaRule> cueRules();
std::span<const MetaRule> waveRules(); // of its other chunks
std::span<const MetaRule> aiffRules();
std::span<const MetaRule> cafRules();

/// The rule for a name in a container; null when there is none.
const MetaRule* ruleFor(const MetaName& name, FourCC container);

/// `name` parsed, and for a value to be set its value checked as far as that goes without a file. Throws UsageError
/// for what no container has.
MetaStep metaStep(const std::string& name, const std::optional<std::string>& text, bool isLenient);
/// Whether it can be the name of a field that is edited somewhere.
bool isEditedField(const std::string& name);
/// Why it is none, in words: ", did you mean …", or that it is only read.
std::string whyNotEdited(const std::string& name);

/// Once all steps are made: refuses a loop that a step named and that is none.
void checkLoop(MetaEdit& edit, const MetaStep& step);

// Parts of rules:

/// Removes the whole chunk that a step names. Others of its kind have other indices then.
template <FourCC id, FourCC form = 0>
void removeChunk(MetaEdit& edit, const MetaStep& step)
{
    MetaChunk* const chunk = edit.chunkOf(step, id, form);
    if (chunk == nullptr)
        return;
    edit.remove(*chunk);
    if (edit.find(id, 0, form) != nullptr)
        edit.itemRemoved(step, 0);
}

/// Puts text in the place of what stands ahead of the first NUL; where NULs only follow they make room, or fill it up,
/// so that the size stays as it was as long as that can be.
void replaceText(Bytes& bytes, std::string_view text);
