// The rule by which a stored media path becomes absolute: docs/formats/project-package.md.
#pragma once

#include <string>
#include <string_view>

/// The path without ".", ".." and double slashes, judged by its text; ".." at the root stays at the root.
std::string standardizedPath(std::string_view path);

/// Makes the stored paths of one package absolute.
class ProjectMediaPaths {
public:
    /// Takes the package's absolute path, without a slash at its end.
    ProjectMediaPaths(std::string packagePath, bool hasProjectFolder);

    /// False for a path that names no file: an empty one, one with a NUL, and one that claims to lie in the package
    /// but leads out of it. `result` is undefined then. Callers pass the same `result` again, so that its memory is
    /// reused.
    bool makeAbsolute(std::string_view stored, std::string& result) const;

private:
    std::string package_;
    std::string mediaBase_;
    bool hasProjectFolder_;
};
