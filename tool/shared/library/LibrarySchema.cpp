#include "tool/shared/library/LibrarySchema.h"

#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <iterator>

namespace {

// Each step brings an index from the version before to the next one; the first begins with nothing. A step that was
// released is never changed: later ones follow it.
constexpr const char* kSteps[] = {
    R"sql(
-- The folders that were indexed.
CREATE TABLE roots(
    id INTEGER PRIMARY KEY,
    path TEXT NOT NULL UNIQUE,    -- absolute, links resolved, with a slash at the end
    completed INTEGER             -- when it was last gone through to its end, in seconds since 1970
);
CREATE TABLE folders(
    id INTEGER PRIMARY KEY,
    path TEXT NOT NULL UNIQUE,    -- absolute, links resolved, with a slash at the end
    words TEXT NOT NULL,          -- the part that a search for words looks at: from the name of the root on
    mounted INTEGER NOT NULL DEFAULT 0 -- 1: a file system began here when it was last looked at
);
-- The audio files.
CREATE TABLE files(
    id INTEGER PRIMARY KEY,
    folder INTEGER NOT NULL REFERENCES folders(id),
    name TEXT NOT NULL,
    size INTEGER NOT NULL,        -- in bytes
    modified INTEGER NOT NULL,    -- in nanoseconds since 1970
    indexed INTEGER NOT NULL,     -- when it was read, in seconds since 1970
    state TEXT NOT NULL,          -- whole, damaged, unreadable
    kind TEXT,                    -- loop, one-shot, recording
    container_name TEXT,
    file_type TEXT,
    coding TEXT,
    sample_rate REAL,             -- in Hz
    bits_per_sample INTEGER,      -- of linear PCM
    source_bits INTEGER,          -- bits of a sample that count; of lossless codings those of the original
    floating_point INTEGER,       -- 1: samples are floats
    channels INTEGER,
    channel_layout TEXT,
    frames INTEGER,
    duration_seconds REAL,
    bit_rate INTEGER,             -- in bits per second, of compressed sound
    tempo REAL,                   -- in beats per minute
    tempo_source TEXT,            -- the chunk or field that says it
    beat_count INTEGER,
    key_note INTEGER,             -- 0 to 11: C to B
    mode TEXT,                    -- major, minor, neither, both
    key TEXT,                     -- in words
    key_source TEXT,
    signature TEXT,
    category TEXT,
    sub_category TEXT,
    genre TEXT,
    descriptors TEXT,             -- with ", " between them
    title TEXT,
    artist TEXT,
    album TEXT,
    comment TEXT,
    recorded TEXT,                -- when, as the file says it
    sound_hash TEXT,              -- SHA-256 of the samples as stored, in hexadecimal
    copied INTEGER NOT NULL DEFAULT 0 -- 1: another file has the same hash; kept by triggers
);
-- All files that were looked at, audio or not, as they were then: what is the same is not read again.
CREATE TABLE seen(
    folder INTEGER NOT NULL REFERENCES folders(id),
    name TEXT NOT NULL,
    size INTEGER NOT NULL,
    modified INTEGER NOT NULL,
    changed INTEGER NOT NULL,     -- in nanoseconds since 1970
    inode INTEGER NOT NULL,
    file INTEGER,                 -- the row of an audio file; null for other files
    PRIMARY KEY(folder, name)
) WITHOUT ROWID;
-- What is wrong with files.
CREATE TABLE findings(
    file INTEGER NOT NULL REFERENCES files(id),
    kind TEXT NOT NULL,
    text TEXT NOT NULL
);
-- Waveforms: pairs of lowest and highest value, two signed bytes each.
CREATE TABLE overviews(
    file INTEGER PRIMARY KEY REFERENCES files(id),
    frames_per_point INTEGER NOT NULL,
    points BLOB NOT NULL
);
-- All metadata fields and loop tags of a file, as JSON.
CREATE TABLE details(
    file INTEGER PRIMARY KEY REFERENCES files(id),
    fields TEXT,                  -- an array of objects with name, value, and perhaps words
    tags TEXT                     -- an object
);
CREATE INDEX mounted_folders ON folders(path) WHERE mounted = 1;
CREATE INDEX seen_by_inode ON seen(inode) WHERE file IS NOT NULL; -- to find what has moved
-- Each order of a search has an index that ends with it, and each number or name that it asks for one that begins with
-- it; the row stands behind all.
CREATE INDEX files_by_folder ON files(folder, name);
CREATE INDEX files_by_name ON files(name);
CREATE INDEX files_by_size ON files(size);
CREATE INDEX files_by_modified ON files(modified);
CREATE INDEX files_by_tempo ON files(tempo);
CREATE INDEX files_by_key ON files(key_note, mode, tempo);
CREATE INDEX files_by_duration ON files(duration_seconds);
CREATE INDEX files_by_category ON files(category, tempo);
CREATE INDEX files_by_rate ON files(sample_rate);
-- There are few forms; whoever asks for a kind, container, number of channels or rate goes from one to the next.
CREATE INDEX files_by_form ON files(
    coalesce(kind, '') || char(9) || coalesce(container_name, '') || char(9) || coalesce(channels, '') || char(9) ||
    coalesce(sample_rate, ''),
    duration_seconds);
CREATE INDEX files_by_state ON files(state) WHERE state <> 'whole';
CREATE INDEX files_by_sound ON files(sound_hash) WHERE sound_hash IS NOT NULL;
CREATE INDEX copied_files ON files(sound_hash) WHERE copied = 1;
CREATE INDEX findings_by_file ON findings(file);
CREATE INDEX findings_by_kind ON findings(kind, file);

-- What a search for words looks at.
CREATE VIEW search_texts AS SELECT
    f.id AS id, f.name AS name, d.words AS folder, f.title AS title, f.artist AS artist, f.album AS album,
    f.comment AS comment,
    coalesce(f.category, '') || ' ' || coalesce(f.sub_category, '') || ' ' || coalesce(f.genre, '') || ' ' ||
        coalesce(f.descriptors, '') || ' ' || coalesce(f.key, '') AS words
    FROM files f JOIN folders d ON d.id = f.folder;
CREATE VIRTUAL TABLE search USING fts5(
    name, folder, title, artist, album, comment, words,
    content='search_texts', content_rowid='id', tokenize='unicode61 remove_diacritics 2', prefix='2 3');
CREATE TRIGGER file_added AFTER INSERT ON files BEGIN
    INSERT INTO search(rowid, name, folder, title, artist, album, comment, words)
        SELECT id, name, folder, title, artist, album, comment, words FROM search_texts WHERE id = new.id;
END;
CREATE TRIGGER file_changing BEFORE UPDATE OF
    folder, name, title, artist, album, comment, category, sub_category, genre, descriptors, key ON files BEGIN
    INSERT INTO search(search, rowid, name, folder, title, artist, album, comment, words)
        SELECT 'delete', id, name, folder, title, artist, album, comment, words FROM search_texts WHERE id = old.id;
END;
CREATE TRIGGER file_changed AFTER UPDATE OF
    folder, name, title, artist, album, comment, category, sub_category, genre, descriptors, key ON files BEGIN
    INSERT INTO search(rowid, name, folder, title, artist, album, comment, words)
        SELECT id, name, folder, title, artist, album, comment, words FROM search_texts WHERE id = new.id;
END;
CREATE TRIGGER file_leaving BEFORE DELETE ON files BEGIN
    INSERT INTO search(search, rowid, name, folder, title, artist, album, comment, words)
        SELECT 'delete', id, name, folder, title, artist, album, comment, words FROM search_texts WHERE id = old.id;
    DELETE FROM findings WHERE file = old.id;
    DELETE FROM overviews WHERE file = old.id;
    DELETE FROM details WHERE file = old.id;
END;
CREATE TRIGGER folder_moving BEFORE UPDATE OF words ON folders BEGIN
    INSERT INTO search(search, rowid, name, folder, title, artist, album, comment, words)
        SELECT 'delete', s.id, s.name, s.folder, s.title, s.artist, s.album, s.comment, s.words
        FROM files f JOIN search_texts s ON s.id = f.id WHERE f.folder = old.id;
END;
CREATE TRIGGER folder_moved AFTER UPDATE OF words ON folders BEGIN
    INSERT INTO search(rowid, name, folder, title, artist, album, comment, words)
        SELECT s.id, s.name, s.folder, s.title, s.artist, s.album, s.comment, s.words
        FROM files f JOIN search_texts s ON s.id = f.id WHERE f.folder = new.id;
END;
CREATE TRIGGER sound_added AFTER INSERT ON files WHEN new.sound_hash IS NOT NULL BEGIN
    UPDATE files SET copied = 1 WHERE sound_hash = new.sound_hash AND copied = 0 AND
        EXISTS (SELECT 1 FROM files o WHERE o.sound_hash = new.sound_hash AND o.id <> new.id);
END;
CREATE TRIGGER sound_changed AFTER UPDATE OF sound_hash ON files WHEN old.sound_hash IS NOT new.sound_hash BEGIN
    UPDATE files SET copied = 0 WHERE sound_hash = old.sound_hash AND
        NOT EXISTS (SELECT 1 FROM files o WHERE o.sound_hash = old.sound_hash AND o.id <> files.id);
    UPDATE files SET copied = EXISTS (SELECT 1 FROM files o WHERE o.sound_hash = new.sound_hash AND o.id <> new.id)
        WHERE id = new.id OR sound_hash = new.sound_hash;
END;
CREATE TRIGGER sound_gone AFTER DELETE ON files WHEN old.copied = 1 BEGIN
    UPDATE files SET copied = 0 WHERE sound_hash = old.sound_hash AND
        NOT EXISTS (SELECT 1 FROM files o WHERE o.sound_hash = old.sound_hash AND o.id <> files.id);
END;

-- For people with the shell of SQLite.
CREATE VIEW loops AS SELECT
    d.path || f.name AS path, tempo, key, beat_count, signature, category, sub_category, genre, descriptors,
    duration_seconds, container_name, title, artist
    FROM files f JOIN folders d ON d.id = f.folder WHERE f.kind = 'loop';
CREATE VIEW recordings AS SELECT
    d.path || f.name AS path, state, container_name, coding, sample_rate, bits_per_sample, channels, duration_seconds,
    title, artist, album, comment, recorded, datetime(f.modified / 1000000000, 'unixepoch') AS modified, f.size AS size
    FROM files f JOIN folders d ON d.id = f.folder WHERE f.kind = 'recording';
CREATE VIEW problems AS SELECT
    d.path || f.name AS path, p.kind AS kind, p.text AS text
    FROM findings p JOIN files f ON f.id = p.file JOIN folders d ON d.id = f.folder;
CREATE VIEW duplicates AS SELECT
    f.sound_hash AS sound_hash, d.path || f.name AS path, f.size AS size
    FROM files f JOIN folders d ON d.id = f.folder
    WHERE f.copied = 1 ORDER BY f.sound_hash, path;
CREATE VIEW fields AS SELECT
    d.path || f.name AS path, json_extract(e.value, '$.name') AS name, json_extract(e.value, '$.value') AS value,
    json_extract(e.value, '$.words') AS words
    FROM details x JOIN files f ON f.id = x.file JOIN folders d ON d.id = f.folder, json_each(x.fields) e;
)sql",
};

[[noreturn]] void failForOther()
{
    throw Failure("is no index of ktfiles, but another SQLite database");
}

[[noreturn]] void failForNewer(std::int64_t version)
{
    throw Failure(fmt::format("was made by a newer ktfiles (version {} of its tables, this one knows {})", version,
                              libraryVersion()));
}

bool isEmpty(SQLDatabase& database)
{
    return database.number("SELECT count(*) FROM sqlite_schema") == 0;
}

// 0 for a database without tables. Several questions, to be asked of one state.
std::int64_t versionOf(SQLDatabase& database)
{
    const std::int64_t application = database.number("PRAGMA application_id");
    if (application == 0 && isEmpty(database))
        return 0;
    if (application != kLibraryApplication)
        failForOther();
    const std::int64_t version = database.number("PRAGMA user_version");
    if (version > libraryVersion())
        failForNewer(version);
    return version;
}

std::int64_t versionNow(SQLDatabase& database)
{
    const SQLSnapshot snapshot(database); // another program may be making it
    return versionOf(database);
}

} // namespace

std::int64_t libraryVersion()
{
    return std::size(kSteps);
}

void prepareLibrary(SQLDatabase& database)
{
    if (versionNow(database) == libraryVersion())
        return;
    SQLTransaction transaction(database);
    for (std::int64_t version = versionOf(database); version < libraryVersion(); ++version) // another may have done it
        database.run(kSteps[version]);
    database.run(
        fmt::format("PRAGMA application_id = {}; PRAGMA user_version = {}", kLibraryApplication, libraryVersion()));
    transaction.commit();
}

void requireLibrary(SQLDatabase& database)
{
    const std::int64_t version = versionNow(database);
    if (version == 0)
        throw Failure("is an empty index; ktfiles index FOLDER fills it");
    if (version < libraryVersion())
        throw Failure("was made by an older ktfiles; ktfiles index brings it up to date");
}
