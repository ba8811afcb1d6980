#include "tool/page/PageDocument.h"

#include "platform/SecureHash.h"
#include "platform/core/JsonWriter.h"
#include "tool/page/PageLink.h"
#include "tool/page/PageSources.h"
#include "tool/page/PageWave.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"

#include <functional>
#include <map>
#include <string_view>
#include <unordered_map>

namespace {

// Texts and folders that rows share stand in the data once; rows have their numbers.
class Numbered {
public:
    std::size_t numberOf(const std::string& text)
    {
        const auto [place, isNew] = numbers_.try_emplace(text, texts_.size());
        if (isNew)
            texts_.push_back(&place->first);
        return place->second;
    }
    const std::vector<const std::string*>& texts() const { return texts_; }

private:
    std::unordered_map<std::string, std::size_t> numbers_;
    std::vector<const std::string*> texts_; // in the order of their numbers
};

std::string folderOfAll(const std::vector<PageRow>& rows)
{
    if (rows.empty())
        return {};
    std::string_view all = rows.front().place.folder;
    for (const PageRow& row : rows)
        all = commonFolder(all, row.place.folder);
    return std::string(all);
}

std::string lastComponent(std::string_view folder)
{
    folder.remove_suffix(folder.ends_with('/') ? 1 : 0);
    return std::string(folder.substr(folder.rfind('/') + 1));
}

bool needsBytes(const std::string& name, const std::string& shown)
{
    return name != shown;
}

// Names that are not UTF-8 are shown with escapes, and linked by their bytes.
std::string shownFileName(const PageRow& row)
{
    const std::string shown = shownName(row.place.path());
    return shown.substr(shown.rfind('/') + 1);
}

void writeMore(JsonWriter& json, const PageRow& row, const std::string& link)
{
    const bool hasMore = row.isSilent() || !link.empty() || !row.words.empty() || row.previewSeconds > 0;
    if (!hasMore) {
        json.writeNull();
        return;
    }
    json.beginObject();
    json.knownMember("link", link).knownMember("problem", row.problem).knownMember("words", row.words);
    if (row.isGone)
        json.member("gone", true);
    json.knownMember("preview", row.previewLink);
    if (!row.previewSound.empty())
        json.member("embedded", true);
    if (row.previewSeconds > 0)
        json.member("seconds", row.previewSeconds);
    json.endObject();
}

class DataWriter {
public:
    DataWriter(const PageDocument& page, const std::vector<PageRow>& rows)
        : page_(page),
          rows_(rows),
          above_(aboveOf(folderOfAll(rows)))
    {
        texts_.numberOf({});
    }

    std::string text()
    {
        json_.beginObject();
        json_.key("rows").beginArray();
        for (const PageRow& row : rows_)
            write(row);
        json_.endArray();
        json_.key("folders").beginArray();
        for (const std::string* const folder : folders_.texts())
            writeFolder(*folder);
        json_.endArray();
        json_.key("texts").beginArray();
        for (const std::string* const text : texts_.texts())
            json_.write(*text);
        json_.endArray();
        if (page_.isServed)
            json_.member("served", true);
        json_.endObject();
        return std::string(json_.text());
    }

private:
    // Folders are shown from the one on that all sounds are in.
    static std::size_t aboveOf(std::string_view folder)
    {
        return folder.size() - std::min(folder.size(), lastComponent(folder).size() + 1);
    }

    void write(const PageRow& row)
    {
        const std::string shown = shownFileName(row);
        json_.newLine().beginArray();
        json_.write(folders_.numberOf(row.place.folder)).write(shown).write(row.tempo);
        writeText(row.key);
        json_.write(row.note);
        writeText(row.mode);
        json_.write(row.durationSeconds);
        for (const std::string* const text : {&row.category, &row.kind, &row.format, &row.detail, &row.type})
            writeText(*text);
        json_.write(row.wave);
        writeMore(json_, row,
                  needsBytes(row.place.name, shown) && !page_.isServed ? percentEncoded(row.place.name)
                                                                       : std::string());
        json_.endArray();
    }
    void writeText(const std::string& text) { json_.write(texts_.numberOf(text)); }
    void writeFolder(const std::string& folder)
    {
        std::string shown = shownName(folder);
        shown = shown.size() > above_ ? shown.substr(above_) : shown;
        if (shown.size() > 1 && shown.ends_with('/'))
            shown.pop_back();
        json_.newLine().beginArray().write(shown);
        json_.write(page_.isServed ? std::string() : linkToFolder(page_.folder, folder)).endArray();
    }

    const PageDocument& page_;
    const std::vector<PageRow>& rows_;
    std::size_t above_;
    Numbered folders_, texts_;
    JsonWriter json_;
};

// In a script element only this character could end it, or begin a comment.
std::string forScriptElement(std::string_view json)
{
    std::string text;
    text.reserve(json.size());
    for (const char character : json)
        if (character == '<')
            text += "\\u003c";
        else
            text += character;
    return text;
}

std::string escapedHtml(const std::string& text)
{
    std::string escaped;
    for (const char character : printable(text))
        switch (character) {
        case '&':
            escaped += "&amp;";
            break;
        case '<':
            escaped += "&lt;";
            break;
        case '>':
            escaped += "&gt;";
            break;
        case '"':
            escaped += "&quot;";
            break;
        default:
            escaped += character;
        }
    return escaped;
}

std::string previewsElement(const std::vector<PageRow>& rows)
{
    JsonWriter json;
    json.beginObject();
    bool isEmpty = true;
    for (std::size_t i = 0; i < rows.size(); ++i)
        if (!rows[i].previewSound.empty()) {
            json.newLine().member(std::to_string(i), rows[i].previewSound);
            isEmpty = false;
        }
    json.endObject();
    return isEmpty ? std::string()
                   : "<script type=\"application/json\" id=\"previews\">" + std::string(json.text()) + "</script>\n";
}

std::string hashSource(std::string_view text)
{
    const platform::SHA256Digest digest = platform::sha256(bytesOf(text));
    return "'sha256-" + base64(textOf(digest)) + "'";
}

} // namespace

std::string PageDocument::policy()
{
    return "default-src 'none'; script-src " + hashSource(pagesources::script) + "; style-src " +
           hashSource(pagesources::style) + "; media-src 'self' file: blob:; base-uri 'none'; form-action 'none'";
}

std::string PageDocument::text(const std::vector<PageRow>& rows) const
{
    const std::string common = lastComponent(shownName(folderOfAll(rows)));
    const std::string heading = escapedHtml(!title.empty() ? title : !common.empty() ? common : "Sounds");
    const std::map<std::string_view, std::function<std::string()>> parts = {
        {"policy", [] { return policy(); }},
        {"title", [&] { return heading; }},
        {"style", [] { return std::string(pagesources::style); }},
        {"script", [] { return std::string(pagesources::script); }},
        {"data", [&] { return forScriptElement(DataWriter(*this, rows).text()); }},
        {"previews", [&] { return previewsElement(rows); }},
    };
    std::string page;
    std::string_view rest = pagesources::document;
    for (std::size_t open = rest.find("{{"); open != rest.npos; open = rest.find("{{")) {
        const std::size_t close = rest.find("}}", open);
        page += rest.substr(0, open);
        page += parts.at(rest.substr(open + 2, close - open - 2))();
        rest.remove_prefix(close + 2);
    }
    page += rest;
    return page;
}
