#include "tool/shared/library/AddedFiles.h"

AddedFiles::AddedFiles(SQLDatabase& database)
    : database_(database),
      findTriggers_(database, "SELECT name, sql FROM sqlite_schema WHERE type = 'trigger' AND "
                              "name IN ('file_added', 'sound_added')"),
      addWords_(database, "INSERT INTO search(rowid, name, folder, title, artist, album, comment, words) "
                          "SELECT id, name, folder, title, artist, album, comment, words FROM search_texts "
                          "WHERE id >= ?"),
      markCopies_(database, "UPDATE files SET copied = 1 WHERE copied = 0 AND sound_hash IN "
                            "(SELECT sound_hash FROM files NOT INDEXED WHERE id >= ? AND sound_hash IS NOT NULL) AND "
                            "EXISTS (SELECT 1 FROM files o WHERE o.sound_hash = files.sound_hash AND o.id <> files.id)")
{
}

void AddedFiles::begin()
{
    triggers_.clear();
    first_ = 0;
}

void AddedFiles::expect()
{
    if (!triggers_.empty())
        return;
    std::string removal;
    while (findTriggers_.step()) {
        removal += "DROP TRIGGER " + findTriggers_.text(0) + ";";
        triggers_.push_back(findTriggers_.text(1));
    }
    database_.run(removal);
}

void AddedFiles::note(std::int64_t file)
{
    if (first_ == 0)
        first_ = file;
}

void AddedFiles::settle()
{
    if (first_ == 0)
        return;
    addWords_.bind(1, first_).run();
    markCopies_.bind(1, first_).run();
    first_ = 0;
}

void AddedFiles::end()
{
    settle();
    for (const std::string& trigger : triggers_)
        database_.run(trigger);
    triggers_.clear();
}
