// The folders that mean something to the desktop.
#pragma once

#include "platform/URL.h"

#include <cstdint>
#include <string>
#include <vector>

namespace platform {

/// Where the desktop's folders lie: absolute paths without a slash at the end.
struct Places {
    std::string home;       // of the process's real user
    std::string dataHome;   // of the user's data: "~/.local/share" unless the environment says otherwise
    std::string root;       // ahead of "/Library", "/Network/Library" and "/System/Library"; empty for the true root
    std::string executable; // the program of this process; empty when it is not known
    std::uint32_t user = 0; // the user's number, in the names of trash folders
};

/// The places of this process, read from the system on first use. Only tests assign to them.
KT_EXPORT Places& places();

/// The Library folders of the user, the machine, the network and the system, in this order, whether or not they
/// exist.
KT_EXPORT std::vector<std::string> libraryFolders();

/// Whether the item lies in a folder for trashed files, by the rules of the desktop (freedesktop.org, Trash 1.0): the
/// home trash, or ".Trash/UID" and ".Trash-UID" at the top of its volume.
KT_EXPORT bool isInTrash(const String& path);

/// Whether the desktop hides the item itself: its name begins with a dot, or its folder's ".hidden" lists it.
KT_EXPORT bool isInvisible(const String& path);

/// The folder of this process's application: the nearest one above the program whose name ends with ".app" or
/// ".AppDir", else the program's own folder. Empty when it is not known.
KT_EXPORT std::string applicationBundle();

} // namespace platform
