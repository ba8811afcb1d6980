// The information dictionary: reading, converting between its two sets of keys, writing.
#include "project/ProjectInformation.h"

#include "platform/ApplicationInfo.h"
#include "platform/FileSystem.h"
#include "platform/PropertyList.h"
#include "platform/SmallFile.h"
#include "platform/core/ASCIICase.h"
#include "platform/core/Status.h"
#include "project/ProjectErrors.h"
#include "project/ProjectLayout.h"
#include "project/ProjectLists.h"
#include "project/ValueReading.h"

using platform::Dictionary;
using platform::Error;
using platform::URLRef;

namespace {

constexpr std::string_view kProjectNameToken = "{PROJECT_NAME}";
constexpr std::int64_t kBundleVersion = 2;

std::string replacingEvery(std::string_view text, std::string_view what, std::string_view by)
{
    std::string result;
    for (;;) {
        const std::size_t found = what.empty() ? text.npos : text.find(what);
        result += text.substr(0, found);
        if (found == text.npos)
            return result;
        result += by;
        text.remove_prefix(found + what.size());
    }
}

Dictionary replacingInNames(Dictionary names, std::string_view what, std::string_view by)
{
    for (auto& [index, name] : names)
        if (auto* text = name.get<std::string>())
            *text = replacingEvery(*text, what, by);
    return names;
}

} // namespace

std::optional<std::string> ProjectInformation::projectDisplayNameWithoutExtension(const URLRef& location)
{
    if (!location)
        return std::nullopt;
    platform::String name = platform::displayName(*location);
    if (name.isNull()) // the item does not exist (yet): use the name it would have
        name = location->copyLastPathComponent();
    if (name.isNull())
        return std::nullopt;
    std::string text = name.utf8();
    for (const std::string_view extension : {".fuguex", ".band"})
        if (text.size() > extension.size() &&
            equalIgnoringASCIICase(std::string_view(text).substr(text.size() - extension.size()), extension)) {
            text.resize(text.size() - extension.size());
            break;
        }
    return text;
}

Dictionary ProjectInformation::convertNamesToTokenBased(const Dictionary& names, const URLRef& projectURL)
{
    return replacingInNames(names, projectDisplayNameWithoutExtension(projectURL).value_or(""), kProjectNameToken);
}

Dictionary ProjectInformation::convertNamesFromTokenBased(const Dictionary& names, const URLRef& projectURL)
{
    const auto name = projectDisplayNameWithoutExtension(projectURL);
    return name ? replacingInNames(names, kProjectNameToken, *name) : names;
}

std::optional<Dictionary> ProjectInformation::infoDictionaryWithContentsOfURL(const URLRef& url,
                                                                              platform::PropertyListReading reading)
{
    const auto bytes = platform::readSmallFile(pathOf(url).c_str(), kLargestProjectList);
    return bytes ? dictionaryFromBytes(*bytes, reading) : std::nullopt;
}

std::optional<Dictionary> ProjectInformation::infoDictionaryFromProjectBundleURL(const URLRef& bundleURL,
                                                                                 platform::PropertyListReading reading)
{
    std::optional<Dictionary> info =
        infoDictionaryWithContentsOfURL(projectInformationURLForBundleURL(bundleURL, CreateDirectories::no), reading);
    if (!info)
        return std::nullopt;
    const std::int64_t version = integerOf(valueFor(*info, ProjectInfoKey::bundleVersion)).value_or(0);
    if (version == 1) {
        if (const auto* names = platform::find<Dictionary>(*info, ProjectInfoKey::variantNames))
            info->insert_or_assign(ProjectInfoKey::variantNamesV2, convertNamesToTokenBased(*names, bundleURL));
        addVersionAndAppInfoToInfoDictionary(*info);
    } else if (version >= 2) {
        if (const auto* names = platform::find<Dictionary>(*info, ProjectInfoKey::variantNamesV2))
            info->insert_or_assign(ProjectInfoKey::variantNames, convertNamesFromTokenBased(*names, bundleURL));
    }
    return info;
}

void ProjectInformation::addVersionAndAppInfoToInfoDictionary(Dictionary& info)
{
    const platform::ApplicationInfo& application = platform::applicationInfo();
    info.insert_or_assign(ProjectInfoKey::bundleVersion, kBundleVersion);
    info.insert_or_assign(ProjectInfoKey::lastSavedFrom, application.name + " " + application.fullVersion);
}

Dictionary ProjectInformation::infoDictionaryForProjectBundleURL(const Dictionary& info, const URLRef& bundleURL)
{
    Dictionary stamped = info;
    addVersionAndAppInfoToInfoDictionary(stamped);
    if (const auto* names = platform::find<Dictionary>(stamped, ProjectInfoKey::variantNames))
        stamped.insert_or_assign(ProjectInfoKey::variantNamesV2, convertNamesToTokenBased(*names, bundleURL));
    return stamped;
}

bool ProjectInformation::writeInfoDictionaryToURL(const Dictionary& info, const URLRef& url, Error* error)
{
    if (pathOf(url).empty())
        return platform::fail(error, platform::ErrorDomain::status, kStatusBadReference, "no place to write to");
    const auto bytes = platform::writePropertyList(info, platform::PropertyListFormat::binary, error);
    if (!bytes)
        return false;
    // Kept: writes into the file itself, which keeps its links; a caller who needs the old one to survive writes to
    // another name
    return platform::writeSmallFile(pathOf(url).c_str(), *bytes) || failWithSystemError(error);
}

bool ProjectInformation::writeInfoDictionaryToProjectBundleURL(const Dictionary& info, const URLRef& bundleURL,
                                                               Error* error)
{
    const URLRef url = projectInformationURLForBundleURL(bundleURL, CreateDirectories::yes);
    if (!url && !pathOf(bundleURL).empty())
        return failWithSystemError(error);
    return writeInfoDictionaryToURL(infoDictionaryForProjectBundleURL(info, bundleURL), url, error);
}
