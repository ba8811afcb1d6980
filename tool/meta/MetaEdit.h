// Edits metadata by field in memory. Rules define a field's names, its values, and how it is put into its chunk, which
// is otherwise unchanged to the byte.
#pragma once

#include "audiofile/fields/FileMetadata.h"
#include "tool/meta/MetaNames.h"
#include "tool/meta/MetaValues.h"

#include <functional>

/// One field to set or remove.
struct MetaStep {
    MetaName name;
    std::optional<std::string> text; // as typed; none: remove
    MetaValue value;                 // as its rule expects it

    /// The name of another field in the same group: "bext[1].umid".
    std::string sibling(std::string_view field) const { return name.upTo(0) + "." + std::string(field); }
    bool isRemoval() const { return std::holds_alternative<std::monostate>(value); }
    /// Empty, or 0, for a removal.
    std::string string() const;
    std::int64_t number() const;
    double decimal() const;
};

/// The chunks of one file while steps are applied.
class MetaEdit {
public:
    /// Changes the chunks of `held`. `isLenient` accepts values that a standard forbids; `makesNext` makes the index
    /// after the last item mean a new one, as `[new]` does.
    MetaEdit(HeldMetadata& held, const std::vector<MetaStep>& steps, bool isLenient, bool makesNext = false);

    /// Applies all steps, removals last. Throws Failure.
    void apply();

    /// Ids of the chunks that were changed, added or removed.
    const std::vector<FourCC>& touched() const { return touched_; }
    /// Names of items removed by index, after which later items have other names: "cue[1]".
    const std::vector<std::string>& removedItems() const { return removedItems_; }

    // For rules. They throw Failure for what the file does not allow.

    bool isLenient() const { return isLenient_; }
    const HeldMetadata& file() const { return held_; }
    /// Whether a step sets or removes this field.
    bool names(std::string_view field) const;

    /// The chunk with an id, and a form unless that is 0, by index among its kind; null if there is none.
    MetaChunk* find(FourCC id, std::size_t index = 0, FourCC form = 0);
    MetaChunk& add(FourCC id, Bytes body);
    void replace(MetaChunk& chunk, Bytes body);
    void remove(MetaChunk& chunk);
    /// The chunk that the step's group names by the number in its brackets; null for a new one. A removal continues
    /// only if the chunk exists.
    MetaChunk* chunkOf(const MetaStep& step, FourCC id, FourCC form = 0);

    /// Reads the chunk that the step's group names, or makes `fresh`, changes it and writes it.
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

    /// The index, among `count` items, that a part of the name refers to; `count` for a new item, which the caller
    /// appends. None when removing an item that does not exist.
    std::optional<std::size_t> itemOf(const MetaStep& step, std::size_t part, std::size_t count);
    /// Records that the step removed an item by index.
    void itemRemoved(const MetaStep& step, std::size_t part);

    /// The position or length of a step in frames, at most `most`; beyond the end of the sound only if that is
    /// accepted. 0 for a removal.
    std::uint64_t framesOf(const MetaStep& step, std::uint64_t most) const;
    std::uint64_t framesWithinSound(const MetaStep& step) const; // fits 32 bits
    [[noreturn]] static void refuse(const MetaStep& step, const std::string& why);

private:
    void touch(FourCC id);

    HeldMetadata& held_;
    std::vector<MetaStep> steps_;
    bool isLenient_, makesNext_;
    std::int64_t nextOffset_ = -1; // distinguishes new chunks from those of the file
    std::vector<FourCC> touched_;
    std::vector<std::string> removedItems_;
    std::map<std::string, std::size_t, std::less<>> newItems_;
};

struct MetaRule {
    std::string_view pattern; // "cue[N].label"; a trailing "*" matches anything
    MetaKind kind = MetaKind::none;
    MetaRange range;
    void (*apply)(MetaEdit& edit, const MetaStep& step) = nullptr;
    bool isAlwaysThere = false; // removed only with its item
};

// By container, like readers.
std::span<const MetaRule> bextRules(); // WAVE, as are the next four
std::span<const MetaRule> infoRules();
std::span<const MetaRule> xmlRules();
std::span<const MetaRule> cueRules();
std::span<const MetaRule> waveRules(); // other chunks of WAVE
std::span<const MetaRule> aiffRules();
std::span<const MetaRule> cafRules();

/// The rule for a name in a container; null if there is none.
const MetaRule* ruleFor(const MetaName& name, FourCC container);

/// Parses `name` and checks the value as far as possible without a file. Throws UsageError for a name that no container
/// has.
MetaStep metaStep(const std::string& name, const std::optional<std::string>& text, bool isLenient);
/// Whether the name may belong to a field that can be edited.
bool isEditedField(const std::string& name);
/// Why it does not: ", did you mean …", or that the field is read-only.
std::string whyNotEdited(const std::string& name);

/// Call after all steps: refuses an invalid loop that a step has set.
void checkLoop(MetaEdit& edit, const MetaStep& step);

// Parts of rules.

/// Removes the whole chunk that a step names. Others of its kind change their index.
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

/// Replaces the text before the first NUL. If only NULs follow it, they make room or fill up, so that the size stays
/// the same if possible.
void replaceText(Bytes& bytes, std::string_view text);
