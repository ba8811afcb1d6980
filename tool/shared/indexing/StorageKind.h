// Where folders lie: storage of this machine, or another's.
#pragma once

#include <string>

/// Whether a file system of another machine, or one that a program provides, holds the folder: changes that others make
/// there are not announced here, and each question takes its time.
bool isOnNetwork(const std::string& folder);
/// Whether a file keeps its inode until it is replaced; on the FAT of a memory stick it has another one each time that
/// this is plugged in.
bool haveLastingInodes(const std::string& folder);
