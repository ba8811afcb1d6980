// Parts of the library in files of their own beside it. They bring other libraries with them, so each is loaded when
// it is first needed.
#pragma once

namespace platform {

/// The object that the module `ktfiles/FILE`, in the folder of the library or of the program that it is linked into,
/// exports as `symbol`; null when there is none. A module stays loaded, since anybody may hold what it made.
const void* loadModule(const char* file, const char* symbol);

} // namespace platform
