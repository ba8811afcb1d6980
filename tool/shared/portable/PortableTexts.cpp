#include "tool/shared/portable/PortableTexts.h"

#include "audiofile/metadata/CommentList.h"
#include "audiofile/metadata/InfoList.h"
#include "files/AudioFileTypes.h"
#include "loops/tagging/CAFPayloads.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/FileText.h"

#include <algorithm>
#include <array>

using platform::decodeFileText;
using platform::FallbackEncoding;

namespace {

struct TextRow {
    const char* key;
    FourCC info; // in LIST "INFO"
    FourCC aiff; // 0: no chunk
};
constexpr std::array kRows{TextRow{"title", fourCC("INAM"), fourCC("NAME")},
                           TextRow{"artist", fourCC("IART"), fourCC("AUTH")},
                           TextRow{"copyright", fourCC("ICOP"), fourCC("(c) ")},
                           TextRow{"comments", fourCC("ICMT"), fourCC("ANNO")},
                           TextRow{"album", fourCC("IPRD"), 0},
                           TextRow{"genre", fourCC("IGNR"), 0},
                           TextRow{"recorded date", fourCC("ICRD"), 0},
                           TextRow{"track number", fourCC("IPRT"), 0}};

template <class Value>
const TextRow* rowOf(const Value TextRow::*member, const Value& value)
{
    const auto* found = std::ranges::find(kRows, value, member);
    return found != kRows.end() ? &*found : nullptr;
}

const TextRow* rowOfKey(std::string_view key)
{
    const auto* found = std::ranges::find_if(kRows, [key](const TextRow& row) { return key == row.key; });
    return found != kRows.end() ? &*found : nullptr;
}

std::string upToNUL(std::string_view text)
{
    return std::string(text.substr(0, text.find('\0')));
}

} // namespace

bool isOfOneCoding(std::string_view infoKey)
{
    constexpr std::array<std::string_view, 3> keys{"approximate duration in seconds", "nominal bit rate",
                                                   "channel layout"};
    return std::ranges::find(keys, infoKey) != keys.end();
}

void PortableTexts::add(std::string_view key, std::string text)
{
    const auto found = std::ranges::find(texts, key, [](const auto& each) { return std::string_view(each.first); });
    if (found == texts.end())
        texts.emplace_back(key, std::move(text));
    else if (key == "comments") // AIFF may have several
        found->second += "\n" + text;
}

void PortableTexts::addFromWAVE(BytesView list, std::endian order)
{
    const auto info = InfoList::read(list, order);
    if (!info)
        return;
    for (const ListItem& item : info->items()) {
        const TextRow* const row = rowOf(&TextRow::info, item.id);
        if (row != nullptr)
            add(row->key, decodeFileText(textUpToNUL(item.body), FallbackEncoding::latin1).utf8);
        else
            others.push_back(fourCCText(item.id));
    }
}

void PortableTexts::addFromAIFF(FourCC id, BytesView body)
{
    if (const TextRow* const row = id != 0 ? rowOf(&TextRow::aiff, id) : nullptr; row != nullptr)
        add(row->key, decodeFileText(upToNUL(textOf(body)), FallbackEncoding::macintosh).utf8);
}

bool PortableTexts::addComments(BytesView comments)
{
    const auto list = CommentList::read(comments);
    if (!list)
        return false;
    for (const AIFFComment& comment : list->comments)
        if (comment.marker == 0)
            add("comments", decodeFileText(comment.text, FallbackEncoding::macintosh).utf8);
    return std::ranges::any_of(list->comments, [](const AIFFComment& comment) { return comment.marker != 0; });
}

void PortableTexts::addFromCAF(BytesView info)
{
    tagging::ForEachCAFInfoString(info, [this](std::string_view key, std::string_view text) {
        if (const TextRow* const row = rowOfKey(key); row != nullptr)
            add(key, decodeFileText(text, FallbackEncoding::latin1).utf8);
        else if (!isOfOneCoding(key))
            others.emplace_back(key);
    });
}

std::vector<HeldChunk> PortableTexts::chunksFor(FourCC fileType, std::vector<std::string>& left) const
{
    std::vector<HeldChunk> chunks;
    InfoList list;
    tagging::StringPairs pairs;
    for (const auto& [key, text] : texts) {
        const TextRow* const row = rowOfKey(key);
        if (fileType == kWAVE)
            list.set(row->info, text);
        else if (fileType == kCaff)
            pairs.emplace(key, text);
        else if (row->aiff != 0)
            chunks.push_back({row->aiff, Bytes(bytesOf(text).begin(), bytesOf(text).end())});
        else
            left.push_back(key);
    }
    if (!list.items().empty())
        chunks.push_back({fourCC("LIST"), list.write()});
    if (!pairs.empty())
        if (auto info = CAFInfoStringsData(pairs))
            chunks.push_back({fourCC("info"), std::move(*info)});
    return chunks;
}
