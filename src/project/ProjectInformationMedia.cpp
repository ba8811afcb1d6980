// The media that alternatives use.
#include "project/ProjectInformation.h"

#include "project/ProjectLayout.h"
#include "project/ProjectMediaPaths.h"

#include <array>
#include <span>
#include <utility>

namespace {

const char* keyOf(ProjectMediaKind kind)
{
    return kProjectMediaLists[static_cast<std::size_t>(kind)].key;
}

} // namespace

void ProjectInformation::addFiles(ProjectFileSet& files, ProjectMediaKind kind, long index)
{
    const platform::Value* value = metaData(index, keyOf(kind));
    const auto* list = value != nullptr ? value->get<platform::Array>() : nullptr;
    if (list == nullptr)
        return;
    const ProjectMediaPaths paths(standardizedPath(pathOf(projectURL_)), hasProjectFolder());
    std::array<std::string, 32> made; // reused, so that their memory is allocated once
    std::size_t count = 0;
    for (const platform::Value& element : *list) {
        const auto* stored = element.get<std::string>();
        count += stored != nullptr && paths.makeAbsolute(*stored, made[count]);
        if (count == made.size())
            files.insert(std::span(made).first(std::exchange(count, 0)));
    }
    files.insert(std::span(made).first(count));
}

std::vector<std::string> ProjectInformation::relativeFilepathsUsedByVariantIndex(ProjectMediaKind kind, long index)
{
    std::vector<std::string> paths;
    const platform::Value* value = metaData(index, keyOf(kind));
    if (const auto* list = value != nullptr ? value->get<platform::Array>() : nullptr)
        for (const platform::Value& element : *list)
            if (const auto* stored = element.get<std::string>())
                paths.push_back(*stored);
    return paths;
}

ProjectFileSet ProjectInformation::filesUsedByVariantIndex(ProjectMediaKind kind, long index)
{
    ProjectFileSet files;
    addFiles(files, kind, index);
    return files;
}

ProjectFileSet ProjectInformation::filesUsedByAnyVariant(ProjectMediaKind kind)
{
    ProjectFileSet files;
    for (const long index : variantIndexes())
        addFiles(files, kind, index);
    return files;
}

ProjectFileSet ProjectInformation::allUsedFilesByVariantIndex(long index)
{
    ProjectFileSet files;
    for (const ProjectMediaList& list : kProjectMediaLists)
        addFiles(files, list.kind, index);
    return files;
}

ProjectFileSet ProjectInformation::allUsedFilesByAnyVariant()
{
    ProjectFileSet files;
    for (const long index : variantIndexes())
        for (const ProjectMediaList& list : kProjectMediaLists)
            addFiles(files, list.kind, index);
    return files;
}
