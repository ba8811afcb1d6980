// Loop tags and metadata fields as pairs of texts.
#include "c/Calls.h"
#include "c/EditOptions.h"
#include "c/ValueText.h"
#include "loops/tags/LoopTagFields.h"
#include "loops/tags/LoopTagsEdit.h"
#include "loops/tags/LoopTagsError.h"

#include <charconv>
#include <map>
#include <span>

using platform::Value;

namespace {

ktf_status failForTags(const char* path, const platform::Error& error)
{
    if (error.domain != kLoopTagsErrorDomain)
        return failCallByError(path, error);
    switch (static_cast<LoopTagsError>(error.code)) {
    case LoopTagsError::unknownFile:
    case LoopTagsError::otherFile:
        return failCall(path, KTF_NOT_SUPPORTED, error.description);
    case LoopTagsError::badValue:
        return failCall(path, KTF_PARAMETER_ERROR, error.description);
    case LoopTagsError::cannotKeep:
    case LoopTagsError::wouldLose:
        return failCall(path, KTF_WOULD_LOSE, error.description);
    case LoopTagsError::damagedChunk:
    case LoopTagsError::notAsPlanned:
        break;
    }
    return failCall(path, KTF_FAILED, error.description);
}

/// Tells the texts of a value, of a list each; false when the function wants no more.
bool tell(ktf_text_function function, void* context, const std::string& name, const Value& value)
{
    if (const auto* const list = value.get<platform::Array>())
        return std::ranges::all_of(*list, [&](const Value& each) { return tell(function, context, name, each); });
    return function(context, name.c_str(), valueText(value).c_str()) == 0;
}

/// A number where the whole text is one; else the text, which the library may have a number for.
Value numberOrText(std::string_view text)
{
    std::int64_t number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    return error == std::errc() && end == text.data() + text.size() ? Value(number) : Value(std::string(text));
}

const LoopTagField* fieldNamed(std::string_view name)
{
    const std::span<const LoopTagField> fields = loopTagFields();
    const auto field =
        std::ranges::find(fields, name, [](const LoopTagField& each) { return std::string_view(each.name); });
    return field != fields.end() ? &*field : nullptr;
}

/// The value of a tag that was given `texts` for it; null clears it.
Value valueOf(const LoopTagField& field, const std::vector<const char*>& texts)
{
    using Kind = LoopTagField::Kind;
    if (texts.front() == nullptr)
        return {};
    const bool isNumber = field.kind == Kind::number || field.kind == Kind::transients;
    const auto one = [&](std::string_view text) { return isNumber ? numberOrText(text) : Value(std::string(text)); };
    if (field.kind == Kind::number || field.kind == Kind::text)
        return one(texts.front());
    platform::Array list;
    for (const std::string_view text : texts)
        list.push_back(one(text));
    return list;
}

/// What the caller wants, by tags. The status is told of.
ktf_status readAssignments(const char* path, std::span<const ktf_text_pair> pairs,
                           std::vector<LoopTagAssignment>& assignments)
{
    std::map<const LoopTagField*, std::vector<const char*>> texts;
    for (const ktf_text_pair& pair : pairs) {
        if (pair.name == nullptr)
            return failCallByNull(path);
        const LoopTagField* const field = fieldNamed(pair.name);
        if (field == nullptr)
            return failCall(path, KTF_PARAMETER_ERROR,
                            "no tag that can be set is called \"" + std::string(pair.name) + "\"");
        std::vector<const char*>& of = texts[field];
        const bool isList = field->kind == LoopTagField::Kind::list || field->kind == LoopTagField::Kind::transients;
        of.push_back(pair.value);
        if (of.size() > 1 && (!isList || of.front() == nullptr || pair.value == nullptr))
            return failCall(path, KTF_PARAMETER_ERROR, std::string(pair.name) + " is given more than one value");
    }
    for (const auto& [field, of] : texts) {
        platform::Error error;
        std::optional<LoopTagAssignment> assignment = loopTagAssignment(field->name, valueOf(*field, of), &error);
        if (!assignment)
            return failForTags(path, error);
        assignments.push_back(std::move(*assignment));
    }
    return KTF_OK;
}

} // namespace

ktf_status ktf_each_tag(const char* path, ktf_text_function function, void* context)
{
    if (path == nullptr || function == nullptr)
        return failCallByNull(path);
    return guardedCall(path, [&]() -> ktf_status {
        const platform::URLRef location = locationOfPath(path);
        platform::Error error;
        const std::optional<LoopTags> tags = location ? readLoopTags(location, &error) : std::nullopt;
        if (!tags)
            return location ? failForTags(path, error) : failCall(path, KTF_FILE_NOT_FOUND);
        for (const LoopTagValue& tag : loopTagRecord(*tags))
            if (!tell(function, context, tag.name, tag.value))
                return KTF_OK;
        for (const VireoLoopTransient& transient : tags->transients)
            if (!tell(function, context, "transients", Value(transient.frame())))
                return KTF_OK;
        return KTF_OK;
    });
}

ktf_status ktf_set_tags(const char* path, const ktf_text_pair* tags, std::size_t count, const ktf_edit_options* options)
{
    if (path == nullptr || (tags == nullptr && count != 0))
        return failCallByNull(path);
    return guardedCall(path, [&]() -> ktf_status {
        EditSettings settings;
        std::vector<LoopTagAssignment> assignments;
        ktf_status status = readEditOptions(path, options, settings);
        if (status == KTF_OK)
            status = readAssignments(path, {tags, count}, assignments);
        platform::Error error;
        if (status == KTF_OK && !setLoopTags(path, assignments, settings.how, &error))
            status = failForTags(path, error);
        return status;
    });
}

ktf_status ktf_remove_tags(const char* path, const ktf_edit_options* options)
{
    if (path == nullptr)
        return failCallByNull(path);
    return guardedCall(path, [&]() -> ktf_status {
        EditSettings settings;
        if (const ktf_status status = readEditOptions(path, options, settings); status != KTF_OK)
            return status;
        platform::Error error;
        return removeLoopTags(path, settings.how, &error) ? ktf_status{KTF_OK} : failForTags(path, error);
    });
}
