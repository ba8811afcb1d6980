// The package as a whole: its names, and what the metadata of its alternatives says.
#include "project/ProjectInformation.h"

#include "platform/PropertyList.h"
#include "platform/SmallFile.h"
#include "project/ProjectLayout.h"
#include "project/ProjectLists.h"
#include "project/ValueReading.h"

#include <algorithm>
#include <charconv>

using platform::Dictionary;
using platform::URLRef;
using platform::Value;

namespace {

/// The value of a key that is all digits, with or without leading zeros; null if it is too large for an index.
std::optional<long> indexOf(const std::string& key)
{
    std::uint32_t index = 0;
    const auto [end, problem] = std::from_chars(key.data(), key.data() + key.size(), index);
    if (key.empty() || problem != std::errc() || end != key.data() + key.size())
        return std::nullopt;
    return static_cast<long>(index);
}

bool comesBefore(const std::string& a, const std::string& b)
{
    const auto first = indexOf(a), second = indexOf(b);
    if (first.has_value() != second.has_value())
        return first.has_value();
    return first != second ? *first < *second : a < b;
}

} // namespace

std::unique_ptr<ProjectInformation> ProjectInformation::initWithProjectURL(const URLRef& projectURL)
{
    std::optional<Dictionary> info =
        infoDictionaryFromProjectBundleURL(projectURL, platform::PropertyListReading::lenient);
    if (!info)
        return nullptr;
    return std::unique_ptr<ProjectInformation>(new ProjectInformation(projectURL, std::move(*info)));
}

ProjectInformation::ProjectInformation(URLRef projectURL, Dictionary projectInfo)
    : projectURL_(std::move(projectURL)),
      projectInfo_(std::move(projectInfo))
{
}

Dictionary ProjectInformation::alternativeNames() const
{
    const auto* names = platform::find<Dictionary>(projectInfo_, ProjectInfoKey::variantNames);
    return names != nullptr ? *names : Dictionary();
}

std::vector<std::string> ProjectInformation::variationIndexesSorted() const
{
    std::vector<std::string> indexes;
    if (const auto* names = platform::find<Dictionary>(projectInfo_, ProjectInfoKey::variantNames))
        for (const auto& [index, name] : *names)
            indexes.push_back(index);
    std::sort(indexes.begin(), indexes.end(), comesBefore);
    return indexes;
}

std::optional<std::string> ProjectInformation::variationNameForIndex(long index) const
{
    const auto* names = platform::find<Dictionary>(projectInfo_, ProjectInfoKey::variantNames);
    const auto* name = names != nullptr ? platform::find<std::string>(*names, std::to_string(index)) : nullptr;
    return name != nullptr ? std::optional(*name) : std::nullopt;
}

long ProjectInformation::lastActiveVariation() const
{
    return static_cast<long>(integerOf(valueFor(projectInfo_, ProjectInfoKey::activeVariant)).value_or(0));
}

bool ProjectInformation::hasProjectFolder() const
{
    return integerOf(valueFor(projectInfo_, ProjectInfoKey::hasProjectFolder)).value_or(0) != 0;
}

const Dictionary* ProjectInformation::loadMetaDataForVariant(long index)
{
    const std::string key = std::to_string(index);
    if (const auto* known = platform::find<Dictionary>(metaDataPerVariant_, key))
        return known;
    const URLRef url = metaDataURLForBundleURL(projectURL_, index, CreateDirectories::no);
    const std::string& path = pathOf(url);
    if (path.empty())
        return nullptr;
    const auto read = [](const std::string& list) {
        const auto bytes = platform::readSmallFile(list.c_str(), kLargestProjectList);
        return bytes ? dictionaryFromBytes(*bytes) : std::nullopt;
    };
    std::optional<Dictionary> metaData = read(path);
    if (!metaData)
        metaData = read(path.substr(0, path.rfind('/') + 1) + ProjectLayout::metaDataCopy);
    if (!metaData)
        return nullptr;
    return metaDataPerVariant_.insert_or_assign(key, std::move(*metaData)).first->second.get<Dictionary>();
}

const Value* ProjectInformation::metaData(long index, const char* key)
{
    const Dictionary* metaData = loadMetaDataForVariant(index < 0 ? lastActiveVariation() : index);
    return metaData != nullptr ? valueFor(*metaData, key) : nullptr;
}

namespace {

std::int64_t orZero(const Value* value)
{
    return integerOf(value).value_or(0);
}

std::optional<std::string> textOrNone(const Value* value)
{
    const auto* text = value != nullptr ? value->get<std::string>() : nullptr;
    return text != nullptr ? std::optional(*text) : std::nullopt;
}

} // namespace

std::uint64_t ProjectInformation::sampleRate(long index)
{
    return static_cast<std::uint64_t>(
        std::max<std::int64_t>(orZero(metaData(index, ProjectMetaDataKey::sampleRate)), 0));
}

double ProjectInformation::beatsPerMinute(long index)
{
    return realOf(metaData(index, ProjectMetaDataKey::beatsPerMinute));
}

std::int64_t ProjectInformation::frameRateIndex(long index)
{
    return orZero(metaData(index, ProjectMetaDataKey::frameRateIndex));
}

bool ProjectInformation::isTimeCodeBased(long index)
{
    return orZero(metaData(index, ProjectMetaDataKey::isTimeCodeBased)) != 0;
}

bool ProjectInformation::hasGrid(long index)
{
    return orZero(metaData(index, ProjectMetaDataKey::hasGrid)) != 0;
}

std::int64_t ProjectInformation::surroundFormatIndex(long index)
{
    return orZero(metaData(index, ProjectMetaDataKey::surroundFormatIndex));
}

std::int64_t ProjectInformation::surroundModeIndex(long index)
{
    return orZero(metaData(index, ProjectMetaDataKey::surroundModeIndex));
}

std::int64_t ProjectInformation::signKey(long index)
{
    return orZero(metaData(index, ProjectMetaDataKey::signatureKey));
}

std::int64_t ProjectInformation::timeSignatureNumerator(long index)
{
    return orZero(metaData(index, ProjectMetaDataKey::songSignatureNumerator));
}

std::int64_t ProjectInformation::timeSignatureDenominator(long index)
{
    return orZero(metaData(index, ProjectMetaDataKey::songSignatureDenominator));
}

std::int64_t ProjectInformation::numberOfTracks(long index)
{
    return orZero(metaData(index, ProjectMetaDataKey::numberOfTracks));
}

std::optional<std::string> ProjectInformation::songKeyAsNonLocalizedString(long index)
{
    return textOrNone(metaData(index, ProjectMetaDataKey::songKey));
}

std::optional<std::string> ProjectInformation::songGenderAsNonLocalizedString(long index)
{
    return textOrNone(metaData(index, ProjectMetaDataKey::songGenderKey));
}

std::int64_t ProjectInformation::metaDataVersionOfVariant(long index)
{
    return orZero(metaData(index, ProjectMetaDataKey::version));
}

std::int64_t ProjectInformation::maxMetaDataVersionOfAnyVariant()
{
    std::int64_t largest = 0;
    for (const long index : variantIndexes())
        largest = std::max(largest, metaDataVersionOfVariant(index));
    return largest;
}

std::vector<long> ProjectInformation::variantIndexes() const
{
    std::vector<long> indexes;
    for (const std::string& key : variationIndexesSorted())
        if (const auto index = indexOf(key); index && (indexes.empty() || indexes.back() != *index))
            indexes.push_back(*index);
    return indexes;
}
