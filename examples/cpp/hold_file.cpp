// Appends a line to a text file while no other process that coordinates its access reads or writes it.
// Usage: hold_file FILE TEXT
#include "platform/FileCoordination.h"

#include <cstdio>
#include <filesystem>
#include <fstream>

int main(int argc, char** argv)
{
    if (argc != 3)
        return 2;
    const std::string path = std::filesystem::absolute(argv[1]);
    const platform::CoordinatedItem item(platform::URL::createWithFileSystemBytes(path, false));
    bool written = false;
    const auto append = [&](const platform::URLRef& url) { // this process has the file to itself here
        std::ofstream file(url->posixPath(), std::ios::app);
        written = static_cast<bool>(file << argv[2] << '\n' << std::flush);
    };
    platform::Error error;
    const platform::FileCoordinator coordinator;
    if (!coordinator.coordinateWriting(item, platform::FileCoordinator::WritingOptions::none, append, &error)) {
        std::fprintf(stderr, "%s: %s\n", argv[1], error.description.c_str());
        return 1;
    }
    return written ? 0 : 1;
}
