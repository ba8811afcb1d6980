// The rule by which a stored media path becomes an absolute one: docs/formats/project-package.md.
#pragma once

#include <string>
#include <string_view>

/// Without ".", ".." and double slashes, by its text; ".." at the root stays there.
std::string standardizedPath(std::string_view path);

class ProjectMediaPaths {
public:
    /// The package's absolute path, without a slash at its end.
    ProjectMediaPaths(std::string packagePath, bool hasProjectFolder);

    /// False for what names no file: an empty path, one with a NUL, and one that says that it lies in a package and
    /// then leads out of it. `result` is left with anything then; its memory is used again and again.
    bool makeAbsolute(std::string_view stored, std::string& result) const;

private:
    std::string package_;
    std::string mediaBase_;
    bool hasProjectFolder_;
};
