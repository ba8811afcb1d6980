#include "tool/shared/arguments/CoordinationFolder.h"

#include "platform/FileCoordination.h"

#include <cstdlib>
#include <filesystem>
#include <string>
#include <system_error>

namespace {

constexpr const char* kVariable = "KTFILES_COORDINATION";

} // namespace

void useCoordinationFolderOfEnvironment()
{
    if (const char* const folder = std::getenv(kVariable); folder != nullptr && *folder != '\0')
        platform::FileCoordinator::setCoordinationFolder(folder);
}

void addCoordinationFolder(Verb& verb)
{
    const auto useFolder = [](const std::string& folder) {
        // Set if the working folder is gone; the access then reports what is wrong.
        std::error_code error;
        const std::string absolute = std::filesystem::absolute(folder, error).string();
        ::setenv(kVariable, absolute.c_str(), 1);
        platform::FileCoordinator::setCoordinationFolder(error ? folder : absolute);
    };
    verb.addText("--coordination", useFolder, "The folder in which programs coordinate, the same for all",
                 [](const std::string& text) { return text.empty() ? "a file name is missing" : ""; })
        .label("FOLDER");
}
