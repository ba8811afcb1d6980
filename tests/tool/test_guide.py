"""The guide: its programs are the files in examples/cpp, word for word, and what it types shows what it says."""
import os
import pathlib
import re
import unittest

from command import needs_decoders
from typed import TypedTest

ROOT = pathlib.Path(__file__).resolve().parents[2]
PROGRAM = re.compile(r"^<!-- (examples/cpp/\w+\.cpp) -->\n```cpp\n(.*?)^```$", re.S | re.M)
PAGES = {page.name: page.read_text(encoding="utf-8") for page in sorted((ROOT / "docs/guide").glob("*.md"))}
EXAMPLES = os.environ.get("KTFILES_EXAMPLES")


class GuideTest(TypedTest):
    def test_pages_show_the_programs_as_they_are(self):
        on_pages = {name: code for text in PAGES.values() for name, code in PROGRAM.findall(text)}
        self.assertGreaterEqual(len(on_pages), 8)
        for name, code in on_pages.items():
            self.assertEqual(code, (ROOT / name).read_text(encoding="utf-8"), name)

    def test_the_index_lists_every_page(self):
        self.assertEqual(set(re.findall(r"\]\(([\w-]+\.md)\)", PAGES["README.md"])) - {"from-python.md"}, set(PAGES) - {"README.md", "from-python.md"})


    @needs_decoders
    def test_from_a_laptop_to_a_cluster(self):
        self.assert_shows("from-a-laptop-to-a-cluster.md", PAGES["from-a-laptop-to-a-cluster.md"])


@unittest.skipUnless(EXAMPLES, "the programs of examples/cpp are not built")
class TypedGuideTest(TypedTest):
    """One test for each page that shows a program in C++."""

    def type_page(self, name):
        for program in pathlib.Path(EXAMPLES).iterdir():
            (self.folder / program.name).symlink_to(program)
        self.assert_shows(name, PAGES[name])


for each in (name for name, text in PAGES.items() if PROGRAM.search(text)):
    setattr(TypedGuideTest, "test_" + each.removesuffix(".md").replace("-", "_"), needs_decoders(lambda self, each=each: self.type_page(each)))

if __name__ == "__main__":
    unittest.main()
