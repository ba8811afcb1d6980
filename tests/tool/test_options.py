"""Help, man page and completion: each option of each verb is in all three, and none is in one that the others lack."""
import os
import pathlib
import re
import subprocess
import unittest

from command import CommandTest

ROOT = pathlib.Path(__file__).resolve().parents[2]
OBJECTS = {"chunks": ["get", "add", "remove"], "tags": ["set", "remove", "copy"], "meta": ["set", "remove", "export", "import", "copy"], "index": ["merge", "export"],
           "project": ["media", "dirs", "backup", "restore", "settle", "rename-alternative"]}
# What is written once for several verbs, in sections of their own.
COMMON = {"OPTIONS", "EDITS", "Folders and lists of files", "Sidecars"}


class Options(CommandTest):
    @classmethod
    def setUpClass(cls):
        page = subprocess.run(["groff", "-mdoc", "-Tascii", "-P-cbou", ROOT / "tool/ktfiles.1"], capture_output=True, text=True, check=True).stdout
        parts = re.split(r"^(?:   )?(\S.*)$", page, flags=re.M)
        cls.sections = dict(zip(parts[1::2], parts[2::2]))

    def verbs(self):
        """(verb and perhaps its object, the long options in its help)."""
        names = re.findall(r"^  ([a-z]+) ", self.help().split("Verbs:")[1], re.M)
        self.assertGreater(len(names), 10)
        for words in [[verb, *rest] for verb in names for rest in ([], *([item] for item in OBJECTS.get(verb, [])))]:
            yield words, set(re.findall(r"(?<=[ ,])--[a-z][a-z0-9-]+", "\n".join(
                line[:26] if len(line) > 26 and line[25] == " " else line.split("  ")[1]
                for line in self.help(*words).splitlines() if line.startswith("  -"))))

    def help(self, *words, columns=80):
        return self.run_command("help", *words, env={**os.environ, "COLUMNS": str(columns)}).stdout.decode()

    def completed(self, *words):
        """What bash offers for "--" behind the words."""
        script = f"""_init_completion() {{ cur=--; prev=${{COMP_WORDS[COMP_CWORD - 1]}}; words=("${{COMP_WORDS[@]}}"); cword=$COMP_CWORD; }}
            _filedir() {{ :; }}; . {ROOT}/tool/ktfiles.bash; COMP_WORDS=(ktfiles {" ".join(words)} --); COMP_CWORD={len(words) + 1}; _ktfiles
            printf '%s\\n' "${{COMPREPLY[@]}}" """
        out = subprocess.run(["bash", "-c", script], capture_output=True, text=True, check=True).stdout
        return set(out.split()) - {"--"}

    def test_each_is_in_help_man_page_and_completion(self):
        every = set()
        for words, offered in self.verbs():
            with self.subTest(" ".join(words)):
                self.assertIn("--help", offered)
                every |= offered
                if words == ["help"]:
                    continue
                self.assertEqual(self.completed(*words) | {"--ndjson"}, offered | {"--ndjson"})
                section = "".join(self.sections.get(name, "") for name in {" ".join(words), words[0], *COMMON})
                self.assertEqual({name for name in offered if not re.search(name + r"\b", section)}, set(), "not in the man page")
        told = set(re.findall(r"(?<![\w-])--[a-z][a-z0-9-]+", "".join(text for title, text in self.sections.items() if title != "EXAMPLES")))
        self.assertEqual(told - every - {"--version"}, set(), "only in the man page")

    def test_help_fits_its_columns(self):
        for words, _ in self.verbs():
            for columns in (60, 80, 200):
                text = self.help(*words, columns=columns)
                self.assertEqual([line for line in text.splitlines() if len(line) > min(columns, 100)], [], words)
                self.assertEqual(" ".join(text.split()), " ".join(self.help(*words, columns=100).split()))


if __name__ == "__main__":
    unittest.main()
