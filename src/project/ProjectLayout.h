// The names in a package, and URLs made of them.
#pragma once

#include "platform/URL.h"
#include "project/ProjectInformation.h"

#include <array>

/// Names of folders and files in a package.
namespace ProjectLayout {
inline constexpr const char* resources = "Resources";                         // folder of the package
inline constexpr const char* projectInformation = "ProjectInformation.plist"; // in it: the information dictionary
inline constexpr const char* media = "Media";                                 // folder of media in the package
/// The three generations of the folder of alternatives, newest first.
inline constexpr std::array<const char*, 3> alternatives{"Alternatives", "Variations", "Variants"};
// In an alternative's folder.
inline constexpr const char* metaData = "MetaData.plist";            // what ProjectInformation reads of the alternative
inline constexpr const char* metaDataCopy = "MetaData.bak";          // the copy before
inline constexpr const char* windowImage = "WindowImage.jpg";        // a picture of the window
inline constexpr const char* oldDisplayState = "DisplayState.plist"; // of the display, in older versions
inline constexpr const char* displayStateArchive = "DisplayStateArchive";     // of the display
inline constexpr const char* displayStateMobile = "DisplayStateMobile.plist"; // of the display, on mobile devices
inline constexpr const char* projectData = "ProjectData";                     // the project itself
inline constexpr const char* araFiles = "ARA Files";                          // data of plug-ins
inline constexpr const char* autosave = "Autosave";                           // unsaved changes
inline constexpr const char* backups = "Project File Backups";                // folder of backups
} // namespace ProjectLayout

/// The URL of an item in a folder; null for a null folder.
platform::URLRef itemIn(const platform::URLRef& folder, const char* name, bool isDirectory);
/// The URL of a folder in a folder, created first with CreateDirectories::yes; null, with errno, when that fails.
platform::URLRef folderIn(const platform::URLRef& folder, const char* name, CreateDirectories create);
/// The path by which the system reaches a location; empty for a null URL and one without an absolute path.
const std::string& pathOf(const platform::URLRef& url);
/// Whether something is there, links followed.
bool itemExists(const std::string& path);
/// Whether a folder is there, links followed.
bool folderExists(const std::string& path);
/// Whether both paths lead to one item, links followed.
bool isSameItem(const std::string& a, const std::string& b);
/// Whether a component of `path` below `folder` is a symbolic link.
bool hasLinkBelow(const std::string& folder, const std::string& path);
