#include "platform/OwnedDescriptor.h"

#include "platform/SystemCalls.h"

namespace platform {

OwnedDescriptor::~OwnedDescriptor()
{
    if (number_ >= 0)
        systemCalls().close(number_);
}

std::string pathOfDescriptor(int descriptor)
{
    return "/proc/self/fd/" + std::to_string(descriptor);
}

} // namespace platform
