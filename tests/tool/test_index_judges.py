"""What an index says of files of many formats is what exiftool, mediainfo and mutagen say, but where it is known who is wrong; and what was made."""
import importlib.util
import pathlib
import unittest

from command import KTFILES, CommandTest, needs_decoders

BENCH = pathlib.Path(__file__).resolve().parents[2] / "bench/index_judges.py"
SPEC = importlib.util.spec_from_file_location("index_judges", BENCH)
judges = importlib.util.module_from_spec(SPEC)
SPEC.loader.exec_module(judges)


class IndexJudgesTest(CommandTest):
    @needs_decoders
    def test_the_index_says_what_the_others_say(self):
        library = self.folder.resolve() / "library"
        library.mkdir()
        paths = judges.make_files(library, 64, 64)
        told = []
        unjudged = judges.compare(KTFILES, library, paths, told.append)
        self.assertEqual(unjudged, 0, "\n".join(told))
        compared = {line.split(":")[0]: int(line.split()[-5]) for line in told if line.endswith("differ")}
        self.assertLessEqual({"the maker", "exiftool", "mediainfo"}, set(compared), told)
        self.assertTrue(all(values > 3 * len(paths) for values in compared.values()), compared)

    def test_a_difference_that_nobody_judged_is_found(self):
        ours = {"/a.flac": {"path": "/a.flac", "duration": 1.0, "title": "x"}}
        for theirs in ({"duration": 1.1}, {"title": "y"}, {"album": "z"}):
            self.assertEqual(judges.tell_fields("exiftool", ours, {"/a.flac": {"path": "/a.flac", **theirs}}, lambda line: None), 1, theirs)


if __name__ == "__main__":
    unittest.main()
