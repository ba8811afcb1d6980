// The names in a package, and URLs made of them.
#pragma once

#include "platform/URL.h"
#include "project/ProjectInformation.h"

#include <array>

namespace ProjectLayout {
inline constexpr const char* resources = "Resources";
inline constexpr const char* projectInformation = "ProjectInformation.plist";
inline constexpr const char* media = "Media";
/// Three generations of the folder that holds the alternatives, newest first.
inline constexpr std::array<const char*, 3> alternatives{"Alternatives", "Variations", "Variants"};
// In an alternative's folder.
inline constexpr const char* metaData = "MetaData.plist";
inline constexpr const char* metaDataCopy = "MetaData.bak";
inline constexpr const char* windowImage = "WindowImage.jpg";
inline constexpr const char* oldDisplayState = "DisplayState.plist";
inline constexpr const char* displayStateArchive = "DisplayStateArchive";
inline constexpr const char* displayStateMobile = "DisplayStateMobile.plist";
inline constexpr const char* projectData = "ProjectData";
inline constexpr const char* araFiles = "ARA Files";
inline constexpr const char* autosave = "Autosave";
inline constexpr const char* backups = "Project File Backups";
} // namespace ProjectLayout

/// Null for a null folder.
platform::URLRef itemIn(const platform::URLRef& folder, const char* name, bool isDirectory);
/// Created first where that is asked for; null, with errno, when it cannot be.
platform::URLRef folderIn(const platform::URLRef& folder, const char* name, CreateDirectories create);
/// The path by which the system reaches a location; empty for a null one, and one without an absolute path.
const std::string& pathOf(const platform::URLRef& url);
/// Whether anything is there, links followed.
bool itemExists(const std::string& path);
bool folderExists(const std::string& path);
/// Whether both paths lead to one item, whatever links they take.
bool isSameItem(const std::string& a, const std::string& b);
/// Whether one of the names by which `path` goes on behind `folder` is a symbolic link.
bool hasLinkBelow(const std::string& folder, const std::string& path);
