#include "files/registry/TContainer.h"

namespace {

TContainer* retain(TContainer* container)
{
    ++container->retainCount;
    return container;
}

void release(TContainer* container)
{
    if (--container->retainCount == 0)
        delete container;
}

} // namespace

constinit const TContainerValueCallbacks kTContainerValueCallbacks{.retain = retain, .release = release};
