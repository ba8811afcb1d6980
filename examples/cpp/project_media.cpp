// Lists the alternatives of a project package, and the media that none of the disks has. Usage: project_media PACKAGE
#include "project/ProjectInformation.h"

#include <cstdio>
#include <cstdlib>
#include <filesystem>

int main(int argc, char** argv)
{
    if (argc != 2)
        return 2;
    const std::string path = std::filesystem::absolute(argv[1]);
    const auto project = ProjectInformation::initWithProjectURL(platform::URL::createWithFileSystemBytes(path, true));
    if (!project) {
        std::fprintf(stderr, "%s: no project package\n", argv[1]);
        return 1;
    }
    for (const std::string& key : project->variationIndexesSorted()) {
        const long index = std::strtol(key.c_str(), nullptr, 10);
        std::printf("%s: %s, %g BPM, %lld tracks\n", key.c_str(),
                    project->variationNameForIndex(index).value_or("unnamed").c_str(), project->beatsPerMinute(index),
                    static_cast<long long>(project->numberOfTracks(index)));
        for (const std::string_view file : project->allUsedFilesByVariantIndex(index))
            if (!std::filesystem::exists(file))
                std::printf("  missing: %s\n", std::filesystem::path(file).filename().c_str());
    }
    return 0;
}
