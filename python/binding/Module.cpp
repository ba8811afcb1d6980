// The compiled part of the package: thin, typed by _core.pyi, and made for the modules of the package alone. Paths are
// bytes as the file system has them.
#include "binding/Bindings.h"
#include "binding/Problem.h"

PYBIND11_MODULE(_core, module)
{
    bindProblems(module);
    bindReader(module);
    bindDescription(module);
    bindChunks(module);
    bindOverview(module);
    bindAdm(module);
    bindLocks(module);
    bindTags(module);
    bindMeta(module);
    bindProject(module);
}
