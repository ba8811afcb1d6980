"""ktfiles pair, and what ktfiles info says of names, dates and stereo partners."""
import json
import os
import unittest

from command import CommandTest, wave


class Pair(CommandTest):
    def write_all(self, *names):
        for name in names:
            (self.folder / name).parent.mkdir(parents=True, exist_ok=True)
            self.write(name, wave())

    def test_pairs_and_halves_of_a_folder(self):
        self.write_all("in/Bass.L.wav", "in/Bass.R.wav", "in/Kick.wal", "in/below/Old.air", "in/mono.wav", "in/x.L.mp4",
                       "in/Loud.L.AIF", "in/Loud.R.aif", "in/TUBA.L.WAV", "in/TUBA.R.WAV")
        expected = [
            "in/Bass.L.wav\tin/Bass.R.wav\tpair",
            "in/Kick.wal\tin/Kick.war\tright missing",
            "in/Loud.L.AIF\tin/Loud.R.aif\tpair",
            "in/TUBA.L.WAV\tin/TUBA.R.WAV\tpair",
            "in/below/Old.ail\tin/below/Old.air\tleft missing",
        ]
        self.assertEqual(self.lines("pair", "in"), expected)
        self.assertEqual(self.json("pair", "in")[1], {"left": "in/Kick.wal", "right": "in/Kick.war",
                                                      "leftExists": True, "rightExists": False})
        text, status = self.on_terminal("pair", "in", NO_COLOR="1")
        self.assertEqual(status, 0)
        self.assertEqual(text.splitlines()[:2], ["LEFT              RIGHT             STATE",
                                                 "in/Bass.L.wav     in/Bass.R.wav     pair"])
        self.assertEqual(self.lines("pair", "in", "--quiet"), [])

    def test_suffixes_that_people_write(self):
        self.write_all("a_L.flac", "a_R.flac", "b-l.wav", "b-r.wav", "c L.aif", "c R.aif", "d (L).wav", "d (R).wav", "e.LEFT.WAV",
                       "e.RIGHT.wav", "f_Left.wav", "f_Right.wav", "g-Left.wav", "h_l.WAV", "h_R.wav", "_L.wav", "Model.wav",
                       "i_L.txt", "i_R.txt")
        self.assertEqual(self.lines("pair", "."), [
            "./a_L.flac\t./a_R.flac\tpair", "./b-l.wav\t./b-r.wav\tpair", "./c L.aif\t./c R.aif\tpair",
            "./d (L).wav\t./d (R).wav\tpair", "./e.LEFT.WAV\t./e.RIGHT.wav\tpair", "./f_Left.wav\t./f_Right.wav\tpair",
            "./g-Left.wav\t./g-Right.wav\tright missing", "./h_l.WAV\t./h_R.wav\tpair"])
        self.assertEqual(self.lines("pair", "f_Right.wav"), ["f_Left.wav\tf_Right.wav\tpair"])

    def test_files_that_are_named(self):
        self.write_all("a.L.wav", "a.R.wav", "mono.wav", "b.L.wav")
        os.mkdir(self.folder / "b.R.wav")  # no partner
        self.assertEqual(self.lines("pair", "a.R.wav", "a.L.wav", "mono.wav", "b.L.wav"),
                         ["a.L.wav\ta.R.wav\tpair", "b.L.wav\tb.R.wav\tright missing"])
        self.assertEqual(self.json("pair", "mono.wav"), [])
        self.assertIn("missing.L.wav: file not found", self.failure("pair", "missing.L.wav", "a.L.wav"))
        self.failure("pair", status=2)

    def test_names_that_are_not_utf8(self):
        folder = os.fsencode(self.folder)
        for name in (b"\xff.L.wav", b"\xff.R.wav"):
            with open(os.path.join(folder, name), "wb") as out:
                out.write(wave())
        self.assertTrue(self.lines("pair", ".")[0].endswith("\tpair"))


class LongInfo(CommandTest):
    def setUp(self):
        super().setUp()
        for name in ("Bass.L.wav", "Bass.R.wav", "alone.war", "named.mid"):
            path = self.write(name, wave())
            os.utime(path, (0, 1705320000))  # 2024-01-15 12:00:00 UTC

    def test_json_has_them_always(self):
        stereo, plain = self.json("info", "Bass.R.wav", "named.mid")
        self.assertEqual((stereo["typeByName"], stereo["modified"], stereo["stereoPartner"],
                          stereo["stereoPartnerExists"]), ("WAVE", "2024-01-15T12:00:00Z", "Bass.L.wav", True))
        self.assertEqual((plain["typeByName"], plain["fileType"]), ("Midi", "WAVE"))
        self.assertNotIn("stereoPartner", plain)

    def test_partners_in_any_case(self):
        for left, right in (("a.L.Wav", "a.R.WAV"), ("b.L.WAV", "b.r.Wav"), ("C.AIL", "C.aIr"), ("d.L.wav", "d.R.wav")):
            with self.subTest(left):
                self.write(left, wave())
                self.write(right, wave())
                for name, partner in ((left, right), (right, left)):
                    told, = self.json("info", name)
                    self.assertEqual((told["stereoPartner"], told["stereoPartnerExists"]), (partner, True))
        self.write("e.L.Wav", wave())
        self.write("E.R.wav", wave())  # the rest of the name must be the same
        self.assertFalse(self.json("info", "e.L.Wav")[0]["stereoPartnerExists"])


if __name__ == "__main__":
    unittest.main()
