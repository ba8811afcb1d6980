// References and URLs of a test's files by path.
#pragma once

#include "files/CFileRef.h"

#include <string>

inline CFileRef file(const std::string& path)
{
    return CFileRef(path.c_str(), false);
}

inline CFileRef directory(const std::string& path)
{
    return CFileRef(path.c_str(), true);
}
