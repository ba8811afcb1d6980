// The command `ktfiles`. Each verb has a file of its own, and registers itself with the command line.
#include "platform/Log.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/CoordinationFolder.h"

#include <csignal>
#include <fcntl.h>
#include <unistd.h>

namespace {

// While a standard descriptor is closed, a newly opened file would get its number, and our output.
void occupyStandardDescriptors()
{
    for (const int descriptor : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO})
        if (::fcntl(descriptor, F_GETFD) < 0)
            ::open("/dev/null", descriptor == STDERR_FILENO ? O_WRONLY : O_RDONLY);
}

} // namespace

int main(int argc, char** argv)
{
    occupyStandardDescriptors();
    std::signal(SIGXFSZ, SIG_IGN);    // a file size limit is an error like a full disk
    platform::setLogHandler(nullptr); // the command reports problems in one line itself
    useCoordinationFolderOfEnvironment();
    return CommandLine().run(argc, argv);
}
