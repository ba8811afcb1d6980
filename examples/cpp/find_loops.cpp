// Finds the loops below a folder, whatever they are called, on every core. Usage: find_loops FOLDER
#include "audiofile/CAudioFileIO.h"

#include <algorithm>
#include <atomic>
#include <cstdio>
#include <filesystem>
#include <thread>

int main(int argc, char** argv)
{
    if (argc != 2)
        return 2;
    std::vector<std::string> paths;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(std::filesystem::absolute(argv[1])))
        if (entry.is_regular_file())
            paths.push_back(entry.path());
    std::sort(paths.begin(), paths.end());

    std::vector<float> tempos(paths.size()); // 0: no loop
    std::atomic<std::size_t> next = 0;
    const auto work = [&] {
        CAudioFileIO file; // one for each thread; opened again for each file
        for (std::size_t i = next++; i < paths.size(); i = next++)
            if (file.OpenForChunks(CFileRef(paths[i].c_str(), false), 0) == kStatusOK && file.Info().loopCount == 1)
                tempos[i] = file.Info().loopValue;
    };
    {
        std::vector<std::jthread> threads(std::max(1U, std::thread::hardware_concurrency()));
        for (std::jthread& thread : threads)
            thread = std::jthread(work);
    }
    for (std::size_t i = 0; i < paths.size(); ++i)
        if (tempos[i] > 0)
            std::printf("%g BPM  %s\n", static_cast<double>(tempos[i]),
                        std::filesystem::relative(paths[i], argv[1]).c_str());
    return 0;
}
