#include "tool/shared/indexing/FreshLibrary.h"

#include "tool/shared/indexing/LibraryUpdate.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/FilesProgress.h"

void bringUpToDate(const std::string& path, const LibraryQuery& query, bool quiet)
{
    using Mode = SQLDatabase::Mode;
    Library library(path, query.scopes.empty() ? Mode::write : Mode::create);
    LibraryUpdate update;
    for (const LibraryQuery::Scope& scope : query.scopes)
        update.folders.push_back(scope.path);
    FilesProgress progress("indexing", quiet);
    update.progress = &progress;
    update.tell = reportFailure;
    updateLibrary(library, update);
}
