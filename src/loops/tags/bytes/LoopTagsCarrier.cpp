#include "loops/tags/bytes/LoopTagsCarrier.h"

#include "loops/VireoLoopFileInfoChunkDataTypes.h"
#include "loops/tags/bytes/LoopTagsLayouts.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/String.h"

#include <algorithm>
#include <limits>

using platform::Value;

namespace {

const char* const kNoText = " (it is no UTF-8 text)";

std::string cut(const std::string& text)
{
    constexpr std::size_t most = 60;
    return text.size() > most ? text.substr(0, most) + "..." : text;
}

bool isBlank(const std::string& text)
{
    return text.find_first_not_of(std::string_view(" \t\r\n\v\f\0", 7)) == std::string::npos;
}

} // namespace

LoopTagsCarrier::LoopTagsCarrier(const LoopTags& tags, const RawLoopTags& from, RawLoopTags& to,
                                 std::vector<std::string>& notKept)
    : tags_(tags),
      from_(from),
      to_(to),
      notKept_(notKept),
      isSameKind_(from.fileType == to.fileType)
{
}

void LoopTagsCarrier::carry()
{
    if (hasUnknownLoopCategories(from_) && isSameKind_ && !to_.categories)
        to_.categories = from_.categories;
    else if (hasUnknownLoopCategories(from_) && from_.categories != to_.categories)
        notKept_.emplace_back("the chunk \"cate\" is not kept: its layout is not known");
    for (const LoopTagField& field : loopTagFields()) {
        const std::string_view name = field.name;
        if (name == "signatureTop")
            carryNumbers(loopTagFieldsForKey("signature"));
        else if (field.kind == LoopTagField::Kind::number && name != "signatureBottom")
            carryNumbers({&field});
        else if (field.kind == LoopTagField::Kind::list)
            carryDescriptors(field);
        else if (field.kind == LoopTagField::Kind::text)
            carryText(field);
    }
}

void LoopTagsCarrier::carryNumbers(const std::vector<const LoopTagField*>& fields)
{
    if (isSameKind_ && copyLoopPair(to_, from_, *fields.front()))
        return;
    std::vector<LoopTagAssignment> assignments;
    std::string words;
    bool isThere = false;
    for (const LoopTagField* field : fields) {
        const std::int64_t number = tags_.number(field->key);
        assignments.push_back({field, {}});
        assignments.back().value = number;
        words += (words.empty() ? "" : "/") + std::to_string(number);
        isThere = isThere || number != 0;
    }
    if (!isThere)
        return;
    const std::string name = fields.size() == 1 ? fields.front()->name : "signature";
    if (name == "loopFileType") {
        // A CAF file does not store it; it follows from the other tags.
        const bool isKnown = !isAbsentLoopTag(loopValueUnder(combinedLoopTagsOf(to_), fields.front()->key));
        if (to_.fileType == kAIFF && (isSameKind_ || tags_.number(fields.front()->key) == 1 || !isKnown))
            assign(assignments, true);
        return;
    }
    const auto text = loopPairText(from_, *fields.front());
    const bool isCut =
        name == "beatCount" && text && words == std::to_string(std::numeric_limits<int>::max()) && *text != words;
    if (isCut)
        lose(name, *text, " (it has more than 32 bits)");
    else if (!assign(assignments, true))
        lose(name, words, why_);
}

void LoopTagsCarrier::carryText(const LoopTagField& field)
{
    const bool isComments = field.key == std::string_view(VireoLoopFileInfoChunkDataCommentsKey);
    const auto raw = rawLoopText(from_, field);
    if (!raw || (isComments && isBlank(*raw)))
        return;
    std::string text = tags_.text(field.key);
    if (text.empty() && !isSameKind_)
        return lose(field.name, *raw, kNoText);
    if (isSameKind_ && (text.empty() || !isComments)) {
        if (const LoopTagAssignment assignment{&field, *raw}; !assign({&assignment, 1}, false))
            lose(field.name, *raw, why_);
        return;
    }
    if (isComments && to_.fileType == kAIFF) {
        using Types = VireoLoopFileInfoChunkDataTypes;
        const auto kept =
            Types::commentStringFromAifCommentChunkData(Types::commentDataFromAifCommentChunkStrings(text));
        const std::size_t start = kept && !kept->empty() ? text.find(*kept) : 0;
        if (kept && *kept != text && isBlank(text.substr(0, start)) && isBlank(text.substr(start + kept->size()))) {
            text = *kept;
            notKept_.push_back("the white space around " + std::string(field.name) + " is not kept");
        }
    }
    if (const LoopTagAssignment assignment{&field, text}; !assign({&assignment, 1}, true))
        lose(field.name, text, text.find('\0') != std::string::npos ? " (it holds a NUL)" : why_);
    else if (!isComments && platform::String::fromUTF8(*raw) && *raw != text)
        notKept_.push_back(field.name + (" " + cut(*raw)) + " is kept as " + cut(text));
}

void LoopTagsCarrier::carryDescriptors(const LoopTagField& field)
{
    if (isSameKind_ && copyLoopPair(to_, from_, field))
        return;
    const std::vector<std::string> raw = rawLoopDescriptors(from_);
    platform::Array kept;
    if (isSameKind_) {
        kept.assign(raw.begin(), raw.end());
    } else {
        for (const std::string& each : raw)
            if (!platform::String::fromUTF8(each))
                lose(field.name, each, kNoText);
        const Value read = loopValueUnder(tags_.combined, field.key);
        const auto* list = read.get<platform::Array>();
        for (const Value& value : list != nullptr ? *list : platform::Array()) {
            const std::string& each = *value.get<std::string>();
            if (isKept(field, each))
                kept.push_back(each);
            else if (!each.empty())
                lose(field.name, each);
        }
    }
    const std::size_t count = kept.size();
    if (const LoopTagAssignment assignment{&field, std::move(kept)};
        count > 0 && !assign({&assignment, 1}, !isSameKind_))
        lose(field.name, std::to_string(count), why_);
}

// Whether a file of that kind returns the descriptor, if it were the only one.
bool LoopTagsCarrier::isKept(const LoopTagField& field, const std::string& descriptor) const
{
    RawLoopTags alone;
    alone.fileType = to_.fileType;
    const LoopTagAssignment assignment{&field, platform::Array(1, descriptor)};
    assignLoopTags(alone, {&assignment, 1});
    return loopValueUnder(combinedLoopTagsOf(alone), field.key) == assignment.value;
}

// False if there is no room; then nothing has changed.
bool LoopTagsCarrier::assign(std::span<const LoopTagAssignment> assignments, bool mustBeRead)
{
    RawLoopTags bytes = to_;
    why_.clear();
    if (platform::Error error; !assignLoopTags(bytes, assignments, &error)) {
        why_ = " (" + error.description + ")";
        return false;
    }
    if (mustBeRead) {
        const platform::Dictionary combined = combinedLoopTagsOf(bytes), info = loopTextsOf(bytes);
        for (const auto& [field, value] : assignments)
            if (loopValueUnder(field->isFileInfo ? info : combined, field->key) != value)
                return false;
    }
    to_ = std::move(bytes);
    return true;
}

void LoopTagsCarrier::lose(const std::string& name, const std::string& value, const std::string& why)
{
    notKept_.push_back(name + " " + cut(value) + " is not kept" + why);
}
