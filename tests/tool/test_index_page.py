"""docs/formats/library-index.md says what an index is: each table, column, view and key, and queries that work."""
import json
import pathlib
import re
import sqlite3
import unittest

from command import CommandTest

ROOT = pathlib.Path(__file__).resolve().parents[2]
PAGE = (ROOT / "docs/formats/library-index.md").read_text(encoding="utf-8")
LINE = {"path": "/m/dry shaker.wav", "stamp": {"size": 1, "modified": 1, "changed": 1, "inode": 1}, "indexed": 1, "state": "damaged", "kind": "loop", "tempo": 120.0,
        "key": "A minor", "containerName": "WAVE", "durationSeconds": 3600, "soundHash": "a" * 64, "problems": [{"kind": "truncated", "text": "x"}],
        "fields": [{"name": "info.ISFT", "value": "x"}]}


def rows(text):
    """The cells of a table's rows, without its head."""
    return [[cell.strip().strip("`") for cell in line.strip("|").split("|")] for line in text.splitlines() if line.startswith("| `")]


class IndexPageTest(CommandTest):
    def setUp(self):
        super().setUp()
        lines = [LINE, {**LINE, "path": "/m/other.wav"}, {**LINE, "path": "/m/r.wav", "kind": "recording"}]
        self.run_command("index", "merge", "-", "--db", "a.db", stdin="\n".join(map(json.dumps, lines)).encode())
        self.database = sqlite3.connect(self.folder / "a.db")
        self.addCleanup(self.database.close)

    def columns(self, name):
        return [[column, kind] for _, column, kind, *_ in self.database.execute(f"PRAGMA table_info({name})")]

    def names(self, kind):
        return {name for name, in self.database.execute("SELECT name FROM sqlite_schema WHERE type = ? AND name NOT LIKE 'search_%' AND name NOT LIKE 'sqlite_%'", (kind,))}

    def test_tables(self):
        sections = dict(re.findall(r"^### `(\w+)`\n(.*?)(?=^##)", PAGE, re.M | re.S))
        self.assertEqual(set(sections), self.names("table"))
        for name, text in sections.items():
            self.assertEqual([row[:2] for row in rows(text)], self.columns(name), name)

    def test_views(self):
        on_page = {name: re.findall(r"`(\w+)`", line) for name, line in re.findall(r"^\| `(\w+)` \| (`.*) \|$", PAGE.split("## Views")[1], re.M)}
        self.assertEqual(on_page, {name: [column for column, _ in self.columns(name)] for name in self.names("view")})

    def test_keys_are_those_of_the_records(self):
        files = re.search(r"^### `files`\n(.*?)(?=^##)", PAGE, re.M | re.S).group(1)
        properties = json.loads((ROOT / "docs/schemas/index-export.json").read_text())["$defs"]["record"]["oneOf"][0]["properties"]
        self.assertEqual({row[2] for row in rows(files) if row[2]} | {"path", "stamp", "problems", "overview", "fields", "loopTags"}, set(properties))

    def test_versions(self):
        version, application = (self.database.execute(f"PRAGMA {name}").fetchone()[0] for name in ("user_version", "application_id"))
        self.assertIn(f"the version of the tables: **{version}**", PAGE)
        self.assertIn(f"0x{application:08X} ", PAGE)

    def test_each_query_finds_something(self):
        queries = re.findall(r"^(SELECT .*?);$", re.search(r"```sql\n(.*?)```", PAGE, re.S).group(1), re.M)
        self.assertGreaterEqual(len(queries), 6)
        for query in queries:
            self.assertTrue(self.database.execute(query).fetchall(), query)


if __name__ == "__main__":
    unittest.main()
