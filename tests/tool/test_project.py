"""ktfiles project, and its objects."""
import json
import os
import plistlib
import shutil
import subprocess
import threading
import time
import unittest

from command import KTFILES, CommandTest

ALTERNATIVE = "Alternatives/001/"
BACKUPS = ALTERNATIVE + "Project File Backups/"


class ProjectTest(CommandTest):
    """`Song.fuguex`: two alternatives, the second one active, with all that an exchange takes along."""

    def setUp(self):
        super().setUp()
        self.package = self.folder / "Song.fuguex"
        self.put("Resources/ProjectInformation.plist", plistlib.dumps({
            "BundleVersion": 2, "VariantNames": {"0": "Song", "1": "Other"},
            "VariantNamesV2": {"0": "{PROJECT_NAME}", "1": "Other"}, "ActiveVariant": 1, "HasProjectFolder": False,
            "LastSavedFrom": "Studio 1.0", "Data": b"\1\2\3\4", "Own": [1.5, True]}, fmt=plistlib.FMT_BINARY))
        self.meta = {"SampleRate": 48000, "BeatsPerMinute": 98.5, "SongKey": "C", "SongGenderKey": "major",
                     "SongSignatureNumerator": 3, "SongSignatureDenominator": 4, "NumberOfTracks": 12,
                     "AudioFiles": ["there.wav", "gone.wav", "/old/Song.fuguex/Media/there.wav"],
                     "VideoFiles": ["Media/gone.mov"]}
        self.put(ALTERNATIVE + "MetaData.plist", plistlib.dumps(self.meta))
        self.put(ALTERNATIVE + "ProjectData", b"data")
        self.put(ALTERNATIVE + "ARA Files/deep/file", b"ara")
        self.put("Media/there.wav", b"")

    def put(self, name, content):
        path = self.package / name
        path.parent.mkdir(parents=True, exist_ok=True)
        path.write_bytes(content)

    def read(self, name):
        return (self.package / name).read_bytes()

    def tree(self):
        return {str(path.relative_to(self.package)): path.read_bytes()
                for path in sorted(self.package.rglob("*")) if path.is_file()}


class Show(ProjectTest):
    def test_json_has_the_keys_of_the_dictionaries(self):
        shown = self.record("project", "Song.fuguex")
        self.assertEqual(shown["projectInfo"], {
            "BundleVersion": 2, "VariantNames": {"0": "Song", "1": "Other"},
            "VariantNamesV2": {"0": "{PROJECT_NAME}", "1": "Other"}, "ActiveVariant": 1, "HasProjectFolder": False,
            "LastSavedFrom": "Studio 1.0", "Data": "AQIDBA==", "Own": [1.5, True]})
        first, second = shown["alternatives"]
        self.assertEqual((first["name"], first["active"], "metaData" in first), ("Song", False, False))
        self.assertEqual((second["name"], second["active"], second["metaData"]), ("Other", True, self.meta))
        counts = {item["key"]: (item["count"], item["missing"]) for item in second["media"]}
        self.assertEqual((counts["AudioFiles"], counts["VideoFiles"], counts["PlaybackFiles"]), ((2, 1), (1, 1), (0, 0)))

    def test_media(self):
        media = str(self.package / "Media")
        self.assertEqual(self.lines("project", "media", "Song.fuguex"),
                         [f"audio\tmissing\t{media}/gone.wav", f"audio\t\t{media}/there.wav",
                          f"video\tmissing\t{media}/gone.mov"])
        self.assertEqual(self.record("project", "media", "Song.fuguex", "--missing")["media"],
                         [{"key": "AudioFiles", "file": f"{media}/gone.wav", "exists": False},
                          {"key": "VideoFiles", "file": f"{media}/gone.mov", "exists": False}])
        self.assertIn("no alternative 7", self.failure("project", "media", "Song.fuguex", "--alternative", "7"))

    def json(self, *arguments, **options):  # behind the object
        return json.loads(self.run_command(*arguments, "--json", **options).stdout)

    def test_what_is_no_package(self):
        (self.folder / "Empty.fuguex").mkdir()
        self.write("File.fuguex", b"")
        for name in ("Empty.fuguex", "File.fuguex", "None.fuguex"):
            for arguments in (["project"], ["project", "media"], ["project", "backup"]):
                self.failure(*arguments, name)
        shown, = json.loads(self.run_command("project", "--json", "None.fuguex", status=1).stdout)
        self.assertEqual(shown, {"path": "None.fuguex", "error": "file not found"})
        for arguments in (["project"], ["project", "restore", "Song.fuguex"],
                          ["project", "rename-alternative", "Song.fuguex", "-1", "x"]):
            self.failure(*arguments, status=2)


class Edits(ProjectTest):
    def test_backup_and_restore(self):
        self.assertEqual(self.lines("project", "backup", "Song.fuguex"),
                         ["Song.fuguex: copied alternative 1 to backup 00"])
        for item in ("ProjectData", "MetaData.plist", "ARA Files/deep/file"):
            self.assertEqual(self.read(BACKUPS + "00/" + item), self.read(ALTERNATIVE + item))
        self.put(ALTERNATIVE + "ProjectData", b"newer")
        self.put(ALTERNATIVE + "Autosave/one", b"autosave")
        before = self.tree()
        self.run_command("project", "restore", "--dry-run", "Song.fuguex", "00")
        self.run_command("project", "backup", "--dry-run", "Song.fuguex")
        self.assertEqual(self.tree(), before)
        self.run_command("project", "restore", "Song.fuguex", "00")
        self.assertEqual((self.read(ALTERNATIVE + "ProjectData"), self.read(BACKUPS + "00/ProjectData")),
                         (b"data", b"newer"))
        self.assertFalse((self.package / ALTERNATIVE / "Autosave").exists())
        self.run_command("project", "restore", "Song.fuguex", "00")
        self.assertEqual(self.tree(), before)
        for name in ("01", "../..", ".", "", "/etc"):
            self.failure("project", "restore", "Song.fuguex", name)
        self.put(BACKUPS + "05/MetaData.plist", b"")
        self.assertIn("This backup is missing data and cannot not be restored.",
                      self.failure("project", "restore", "Song.fuguex", "05"))

    def test_failed_backup_leaves_nothing(self):
        self.run_command("project", "backup", "Song.fuguex")
        before = self.tree()
        self.put(ALTERNATIVE + "ProjectData", b"x" * 100000)
        with_limit = 'trap "" XFSZ; ulimit -f 32; exec "$0" project backup Song.fuguex --keep 1'
        result = subprocess.run(["bash", "-c", with_limit, KTFILES], cwd=self.folder, capture_output=True, timeout=60)
        self.assertEqual(result.returncode, 1, result.stderr)
        self.put(ALTERNATIVE + "ProjectData", b"data")
        self.assertEqual(self.tree(), before)
        os.remove(self.package / ALTERNATIVE / "ProjectData")
        self.assertIn("no project data", self.failure("project", "backup", "Song.fuguex"))

    def test_rename(self):
        self.run_command("project", "rename-alternative", "--dry-run", "Song.fuguex", "1", "Song, slower")
        self.assertEqual(self.record("project", "Song.fuguex")["alternatives"][1]["name"], "Other")
        self.run_command("project", "rename-alternative", "--backup", "Song.fuguex", "1", "Song, slower")
        info = plistlib.loads(self.read("Resources/ProjectInformation.plist"))
        self.assertEqual(info["VariantNamesV2"], {"0": "{PROJECT_NAME}", "1": "{PROJECT_NAME}, slower"})
        self.assertEqual(info["Own"], [1.5, True])
        self.assertTrue(info["LastSavedFrom"].startswith("ktfiles "))
        backup = plistlib.loads(self.read("Resources/ProjectInformation.plist.bak"))
        self.assertEqual((backup["VariantNames"]["1"], backup["LastSavedFrom"]), ("Other", "Studio 1.0"))
        os.rename(self.package, self.folder / "Tune.fuguex")
        self.assertEqual(self.record("project", "Tune.fuguex")["projectInfo"]["VariantNames"],
                         {"0": "Tune", "1": "Tune, slower"})
        self.assertIn("no alternative 2", self.failure("project", "rename-alternative", "Tune.fuguex", "2", "x"))
        # A value in brackets is a text as any other.
        self.run_command("project", "rename-alternative", "--in-place", "Tune.fuguex", "1", "[Intro]")
        self.assertEqual(self.record("project", "Tune.fuguex")["alternatives"][1]["name"], "[Intro]")

    def test_interrupted_exchange_is_told_and_settled(self):
        self.put(BACKUPS + "00/ProjectData", b"old")
        after = [[0, 0] for _ in range(5)]
        places = ("Autosave", "ProjectData", "ARA Files", "MetaData.plist", "MetaData.bak")
        for pair, name in zip(after, places):
            for side, folder in enumerate((ALTERNATIVE, BACKUPS + "00/")):
                if (self.package / folder / name).exists():
                    pair[side] = (self.package / folder / name).stat().st_ino
        self.put(ALTERNATIVE + ".exchange.dummy", plistlib.dumps({"Backup": "00", "Items": after}))
        self.assertEqual(self.record("project", "Song.fuguex")["alternatives"][1]["interruptedExchange"], "00")
        self.failure("project", "backup", "Song.fuguex")
        self.assertIn("was cut short; completed it", self.lines("project", "restore", "Song.fuguex", "00")[0])
        self.assertEqual((self.read(ALTERNATIVE + "ProjectData"), self.read(BACKUPS + "00/ProjectData")),
                         (b"old", b"data"))

    def cut_short(self, backup="00", name=None):
        """As if an exchange had been killed behind its first step."""
        self.put(BACKUPS + backup + "/ProjectData", b"old")
        places = ("Autosave", "ProjectData", "ARA Files", "MetaData.plist", "MetaData.bak")
        inode = lambda path: path.stat().st_ino if path.exists() else 0
        items = [[inode(self.package / folder / item) for folder in (ALTERNATIVE, BACKUPS + backup)] for item in places]
        self.put(ALTERNATIVE + ".exchange.dummy", plistlib.dumps({"Backup": name or backup, "Items": items}))
        data, old = self.package / ALTERNATIVE / "ProjectData", self.package / BACKUPS / backup / "ProjectData"
        os.rename(data, self.folder / "aside")
        os.rename(old, data)
        os.rename(self.folder / "aside", old)

    def test_settle(self):
        self.failure("project", "settle", "Song.fuguex")
        before = {path: content for path, content in self.tree().items()}
        record = self.package / ALTERNATIVE / ".exchange.dummy"
        for options, data, ara in (([], b"old", False), (["--undo"], b"data", True), (["--forget"], b"old", True)):
            self.cut_short()
            self.run_command("project", "settle", "--dry-run", *options, "Song.fuguex")
            self.assertTrue(record.exists())
            told = self.record("project", "settle", *options, "Song.fuguex")
            self.assertEqual(told["backup"], "00")
            self.assertFalse(record.exists())
            self.assertEqual(self.read(ALTERNATIVE + "ProjectData"), data)
            self.assertEqual((self.package / ALTERNATIVE / "ARA Files").exists(), ara)
            shutil.rmtree(self.package / BACKUPS)
            for path, content in before.items():
                self.put(path, content)
        elsewhere = str(self.package / BACKUPS / "00" / ".." / "00")  # a path, which a stranger may have written
        self.cut_short(name=elsewhere)
        self.assertIn("--with", self.failure("project", "settle", "Song.fuguex"))
        self.failure("project", "settle", "--with", ".", "Song.fuguex")
        self.run_command("project", "settle", "--undo", "--with", "Song.fuguex/" + BACKUPS + "00", "Song.fuguex")
        self.assertEqual(self.read(ALTERNATIVE + "ProjectData"), b"data")
        record.write_bytes(b"nonsense")
        shown = self.record("project", "Song.fuguex")["alternatives"][1]
        self.assertEqual((shown["isExchangeInterrupted"], "interruptedExchange" in shown), (True, False))
        for command in (["backup"], ["settle"], ["settle", "--undo"]):
            self.failure("project", *command, "Song.fuguex")
        self.assertIn("--forget", self.failure("project", "restore", "Song.fuguex", "00"))
        self.run_command("project", "settle", "--forget", "Song.fuguex")
        self.run_command("project", "backup", "Song.fuguex")

    def test_the_last_good_backup_stays(self):
        self.put(BACKUPS + "05/ProjectData", b"good")
        self.put(BACKUPS + "00/MetaData.plist", b"no backup")
        self.assertEqual(self.lines("project", "backup", "--keep", "2", "Song.fuguex"),
                         ["Song.fuguex: copied alternative 1 to backup 01"])
        self.assertEqual(self.read(BACKUPS + "05/ProjectData"), b"good")
        os.utime(self.package / ALTERNATIVE / "ProjectData", (1, 1))  # old data, newly backed up
        self.run_command("project", "backup", "--keep", "1", "Song.fuguex")
        self.assertEqual(sorted(os.listdir(self.package / BACKUPS)), ["00", "02"])
        self.assertEqual(self.read(BACKUPS + "02/ProjectData"), b"data")

    def test_a_backup_holds_what_links_lead_to(self):
        os.rename(self.package / ALTERNATIVE / "ProjectData", self.folder / "data")
        (self.package / ALTERNATIVE / "ProjectData").symlink_to(self.folder / "data")
        closed = self.package / ALTERNATIVE / "ARA Files/deep"
        closed.chmod(0o555)
        os.mkdir(self.package / BACKUPS, 0o777)
        left = self.package / BACKUPS / ".ktfiles-backup-1-00000000"  # by a process that was killed
        left.mkdir()
        for path in (self.package, self.folder, *self.package.rglob("*"), self.folder / "data"):
            if os.geteuid() == 0:
                os.chown(path, 54321, 54321, follow_symlinks=False)

        def become_user():  # root may write into any folder
            os.setgid(54321)
            os.setuid(54321)
        user = {"preexec_fn": become_user} if os.geteuid() == 0 else {}
        user["env"] = {**os.environ, "KTFILES_COORDINATION": str(self.folder / "coordination")}
        for number in range(2):
            self.run_command("project", "backup", "--keep", "1", "Song.fuguex", **user)
        self.assertEqual(os.listdir(self.package / BACKUPS), ["01"])
        data = self.package / BACKUPS / "01/ProjectData"
        self.assertEqual((data.is_symlink(), data.read_bytes()), (False, b"data"))
        copied = self.package / BACKUPS / "01/ARA Files/deep"
        self.assertEqual((copied.stat().st_mode & 0o777, (copied / "file").read_bytes()), (0o555, b"ara"))
        closed.chmod(0o755)
        (closed / "around").symlink_to("..")
        self.assertIn("around is a link", self.failure("project", "backup", "Song.fuguex", **user))
        self.assertEqual(os.listdir(self.package / BACKUPS), ["01"])
        shutil.rmtree(self.folder / "coordination")

    def test_nothing_goes_through_a_strangers_link(self):
        victim = self.folder / "victim"
        (victim / "00").mkdir(parents=True)
        (victim / "00/ProjectData").write_bytes(b"precious")
        for place, target in ((BACKUPS.rstrip("/"), victim), (BACKUPS + "00", victim / "00")):
            link = self.package / place
            link.parent.mkdir(exist_ok=True)
            link.symlink_to(target)
            self.assertIn("is a link", self.failure("project", "restore", "Song.fuguex", "00"))
            if target == victim:
                self.assertIn("is a link", self.failure("project", "backup", "--keep", "1", "Song.fuguex"))
            else:
                self.run_command("project", "backup", "--keep", "1", "Song.fuguex")
            self.assertEqual({str(path.relative_to(victim)) for path in victim.rglob("*")}, {"00", "00/ProjectData"})
            link.unlink()

    def test_a_link_leads_to_one_package_for_all_that_is_done(self):
        inner = self.folder / "elsewhere/inner"
        inner.mkdir(parents=True)
        os.rename(self.package, self.folder / "elsewhere/Song.fuguex")
        (self.folder / "link").symlink_to(inner)
        (self.folder / "Song.fuguex").mkdir()  # what "link/.." is by its text
        self.run_command("project", "backup", "link/../Song.fuguex")
        self.package = self.folder / "elsewhere/Song.fuguex"
        self.assertEqual(self.read(BACKUPS + "00/ProjectData"), b"data")
        self.assertEqual(os.listdir(self.folder / "Song.fuguex"), [])
        (self.folder / "Alias.fuguex").symlink_to(self.package)
        info = plistlib.loads(self.read("Resources/ProjectInformation.plist"))
        self.put("Resources/ProjectInformation.plist", plistlib.dumps({**info, "HasProjectFolder": True}))
        for name in ("Alias.fuguex", "elsewhere/Song.fuguex"):
            self.assertIn(f"audio\tmissing\t{self.folder}/elsewhere/there.wav",
                          self.lines("project", "media", name))

    def test_edits_wait_for_each_other(self):
        runs = [threading.Thread(target=self.run_command, args=("project", "backup", "Song.fuguex")) for _ in range(6)]
        for run in runs:
            run.start()
        for run in runs:
            run.join()
        self.assertEqual(sorted(os.listdir(self.package / BACKUPS)), ["00", "01", "02", "03", "04", "05"])


if __name__ == "__main__":
    unittest.main()
