// The tables of an index, and how older ones become today's. Page: docs/formats/library-index.md.
#pragma once

#include "tool/shared/library/SQLDatabase.h"

/// What `PRAGMA application_id` says of an index: "KTFi".
inline constexpr std::int64_t kLibraryApplication = 0x4b544669;
/// Today's `PRAGMA user_version`.
std::int64_t libraryVersion();

/// Makes the tables of an empty database, or brings those of an older index up to date, in one transaction. Throws
/// Failure, and changes nothing, for a newer index and for a database of something else.
void prepareLibrary(SQLDatabase& database);
/// Throws the Failure of a database that is no index, or one that another version of the command must prepare first.
void requireLibrary(SQLDatabase& database);
