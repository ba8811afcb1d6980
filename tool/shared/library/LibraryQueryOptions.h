// The options that say what is asked of an index, the same for all verbs that ask.
#pragma once

#include "tool/shared/library/LibraryQuery.h"

class Verb;

/// Adds [FOLDER] and [TERM]..., the options of what a file must be, and those of the order. Call `settleWords` before
/// the query is used.
void addQueryOptions(Verb& verb, LibraryQuery& query);
/// Tells folders among the words from terms. A word is a folder if it names one and is the first word or has a slash
/// in it, or if it ends with a slash. Throws UsageError for what makes no sense together.
void settleWords(LibraryQuery& query);
