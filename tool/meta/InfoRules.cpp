// Sets fields of LIST "INFO".
#include "audiofile/metadata/InfoList.h"
#include "tool/meta/ChunkFields.h"
#include "tool/meta/MetaEdit.h"
#include "tool/shared/arguments/Nearest.h"

#include <fmt/format.h>

#include <algorithm>

namespace {

/// Unregistered ids are accepted only if the file has them already, so that typing errors create none.
void requireKnown(const MetaEdit& edit, const MetaStep& step, const std::string& id, bool stands)
{
    std::vector<std::string> names;
    for (const FourCC known : InfoList::knownIds())
        names.push_back(fourCCText(known));
    if (stands || edit.isLenient() || std::ranges::find(names, id) != names.end())
        return;
    const std::vector<std::string_view> known(names.begin(), names.end());
    MetaEdit::refuse(step,
                     fmt::format("\"{}\" is no registered id{}{}", id,
                                 id.size() == sizeof(FourCC) ? " (--lenient writes it)" : "", didYouMean(id, known)));
}

/// Indices, among the items with the id, of those that `meta` shows: empty texts have no name.
std::vector<std::size_t> shownItems(const InfoList& list, FourCC id)
{
    std::vector<std::size_t> shown;
    std::size_t index = 0;
    for (const ListItem& item : list.items()) {
        if (item.id == id && !textUpToNUL(item.body).empty())
            shown.push_back(index);
        index += item.id == id ? 1U : 0U;
    }
    return shown;
}

void setInfo(MetaEdit& edit, const MetaStep& step)
{
    const MetaName::Part& part = step.name.parts[1];
    const std::string& text = part.name;
    if (step.name.parts.size() != 2 || text.size() != sizeof(FourCC)) {
        requireKnown(edit, step, step.name.rest, false);
        MetaEdit::refuse(step, "an id has four characters");
    }
    const FourCC id = fourCC(text[0], text[1], text[2], text[3]);
    MetaChunk* const chunk = edit.chunkOf(step, kListId, InfoList::kForm);
    auto list = listIn<InfoList>(chunk);
    const std::vector<std::size_t> shown = shownItems(list, id);
    const auto all = static_cast<std::size_t>(std::ranges::count(list.items(), id, &ListItem::id));
    if (step.isRemoval()) {
        if (const auto index = part.number(); index && *index < shown.size() && list.eraseAt(id, shown[*index])) {
            if (shown.size() > 1)
                edit.itemRemoved(step, 1);
            putList(edit, chunk, list);
        }
        return;
    }
    requireKnown(edit, step, text, all != 0);
    const bool isFirst = part.index.empty() && shown.empty(); // an empty item is filled
    const std::size_t index = isFirst ? 0 : *edit.itemOf(step, 1, shown.size());
    list.setAt(id, isFirst ? 0 : index < shown.size() ? shown[index] : all, step.string());
    putList(edit, chunk, list);
}

constexpr MetaRule kInfoRules[] = {
    {"info", MetaKind::none, {}, removeChunk<kListId, InfoList::kForm>},
    {"info.*", MetaKind::text, kAnyLength, setInfo},
};

} // namespace

std::span<const MetaRule> infoRules()
{
    return kInfoRules;
}
