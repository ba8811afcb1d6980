// Parts of the library that lie in files of their own beside it and are loaded when they are first needed, since they
// bring other libraries with them.
#pragma once

namespace platform {

/// The object that the module `ktfiles/FILE`, in the folder of the library or of the program that it is linked into,
/// exports as `symbol`; null when there is none. Once loaded a module stays: what it made is anybody's.
const void* loadModule(const char* file, const char* symbol);

} // namespace platform
