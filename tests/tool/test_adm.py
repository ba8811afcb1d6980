"""ktfiles adm: where the document comes from, the tree, JSON, strict, lenient and checked."""
import json
import re
import struct
import subprocess
import unittest
import xml.etree.ElementTree as ElementTree

from command import KTFILES, MEDIA, CommandTest, chunk, wave

HARBOUR = MEDIA / "harbour-bw64.wav"


def element(name, attributes, *inner):
    """`attributes` as text; the first is the ID."""
    return f"<{name} {attributes}>{''.join(inner)}</{name}>"


def named(name, identifier, text, *inner, more=""):
    return element(name, f'{name}ID="{identifier}" {name}Name="{text}" {more}', *inner)


def reference(name, *identifiers):
    return "".join(f"<{name}IDRef>{identifier}</{name}IDRef>" for identifier in identifiers)


def audio_object(identifier, *inner, more=""):
    return named("audioObject", identifier, "o" + identifier[3:], *inner, more=more)


def block(number, *inner, kind=3, times=""):
    return element("audioBlockFormat", f'audioBlockFormatID="AB_{kind:04X}1001_{number:08X}" {times}', *inner)


def channel(*blocks, kind=3):
    return named("audioChannelFormat", f"AC_{kind:04X}1001", "c", *blocks, more=f'typeLabel="{kind:04X}"')


def position(**coordinates):
    return "".join(f'<position coordinate="{name}">{value}</position>' for name, value in coordinates.items())


def document(*elements):
    return ('<?xml version="1.0"?>\n<audioFormatExtended>\n' + "\n".join(elements) + "\n</audioFormatExtended>\n").encode()


FRONT = position(azimuth=0, elevation=0)


class Source(CommandTest):
    def test_xml_and_chunks(self):
        xml = document(audio_object("AO_1001"))
        ds64 = chunk(b"ds64", bytes(28))
        for name, content in {
                "a.xml": xml, "bom.xml": b"\xef\xbb\xbf" + xml, "blank.xml": b"\n  <x>" + xml[22:] + b"</x>",
                "utf16.xml": xml.decode().replace("?>", ' encoding="UTF-16"?>').encode("utf-16"),
                "a.wav": wave(chunk(b"axml", xml)), "two.wav": wave(chunk(b"axml", b"<old"), chunk(b"axml", xml)),
                "nuls.wav": wave(chunk(b"axml", xml + bytes(10000))),
                "rf64.wav": wave(ds64, chunk(b"axml", xml), container=b"RF64"),
                "bw64.wav": wave(ds64, chunk(b"axml", xml), container=b"BW64")}.items():
            self.write(name, content)
            with self.subTest(name):
                self.assertEqual(self.lines("adm", name), ["0\tobject\tAO_1001\to1001\t"])

    def test_utf16_in_a_chunk(self):
        """The second half of the last character may be a zero byte, like what is reserved behind it."""
        text = document(audio_object("AO_1001")).decode().replace("?>", ' encoding="UTF-16"?>')
        for encoding in ("utf-16-le", "utf-16-be"):
            for mark in ("\ufeff", ""):
                for nuls in (0, 1, 2, 5, 5000):
                    xml = (mark + text.rstrip()).encode(encoding) + bytes(nuls)
                    self.write("a.wav", wave(chunk(b"axml", xml)))
                    with self.subTest(encoding, mark=mark, nuls=nuls):
                        self.assertEqual(self.lines("adm", "a.wav"), ["0\tobject\tAO_1001\to1001\t"])

    def test_no_document(self):
        for name, content, error in (
                ("none.wav", wave(), 'has no chunk "axml"'), ("empty.xml", b"", "is empty"),
                ("empty.wav", wave(chunk(b"axml", bytes(8))), 'its chunk "axml" is empty'),
                ("cut.wav", wave(chunk(b"axml", b"<a/>", size=5000)),
                 'its chunk "axml" claims 5000 bytes, but 4 are there'),
                ("text", b"no tags here", "neither XML nor an audio file known here"),
                ("zeros", bytes(300), "neither XML nor an audio file known here")):
            self.write(name, content)
            with self.subTest(name):
                self.assertEqual(self.failure("adm", name), f"ktfiles: {name}: {error}\n")
                self.assertEqual(self.record("adm", name, status=1), {"path": name, "error": error})


class Tree(CommandTest):
    def words(self, *elements):
        """The details of the lines that are no roots."""
        self.write("a.xml", document(*elements))
        return [line.split("\t")[4] for line in self.lines("adm", "a.xml") if line[0] != "0"]

    def test_blocks_in_words(self):
        at = 'rtime="00:01:02.00000" duration="00:00:00.50000"'
        for inner, times, words in (
                (FRONT, "", "throughout, front"),
                (position(azimuth=30, elevation=-10, distance=0.5), at, "1:02.000–1:02.500, 30° left, 10° down at distance 0.5"),
                (position(azimuth=-180, elevation=90), 'rtime="01:00:00.00001"', "from 1:00:00.00001, back, 90° up"),
                ("<cartesian>1</cartesian>" + position(X=-1, Y=0.25), "", "throughout, 1 left, 0.25 front"),
                ("<cartesian>1</cartesian>" + position(X=0, Y=0, Z=0), "", "throughout, centre"),
                (FRONT + "<gain>0.5</gain>", "", "throughout, front, gain 0.5 (-6.0 dB)"),
                (FRONT + '<gain gainUnit="dB">-6</gain>', "", "throughout, front, gain -6 dB"),
                (FRONT + "<gain>0</gain><headLocked>1</headLocked>", "", "throughout, front, silent, head-locked"),
                (FRONT + "<jumpPosition>1</jumpPosition><width>45</width>", "", "throughout, front, 45 wide, jumps"),
                (FRONT + "<screenRef>1</screenRef><diffuse>0.5</diffuse><importance>3</importance>", "",
                 "throughout, front, importance 3, diffuse 0.5, relative to the screen")):
            with self.subTest(words):
                self.assertEqual(self.words(channel(block(1, inner, times=times))), [words])
        speakers = channel(block(1, "<speakerLabel>M+030</speakerLabel>", kind=1), block(2, kind=1), kind=1)
        self.assertEqual(self.words(speakers),
                         ["throughout, loudspeaker M+030", "throughout, a loudspeaker without label"])

    def test_drawing(self):
        self.write("a.xml", document(
            named("audioProgramme", "APR_1001", "Main", reference("audioContent", "ACO_1001", "ACO_1002")),
            named("audioContent", "ACO_1001", "ナレーション", reference("audioObject", "AO_1001"), "<dialogue>1</dialogue>"),
            named("audioContent", "ACO_1002", "Other"),
            audio_object("AO_1001", reference("audioPackFormat", "AP_00031001"), more='start="00:00:01.00000"'),
            audio_object("AO_1003"), audio_object("AO_1002", reference("audioObject", "AO_1003")),
            named("audioPackFormat", "AP_00031001", "p", reference("audioChannelFormat", "AC_00031001"),
                  more='typeLabel="0003"'),
            channel(*(block(i + 1, FRONT, times=f'rtime="00:00:0{i}.00000"') for i in range(7)))))
        text, status = self.on_terminal("adm", "a.xml", NO_COLOR="1")
        self.assertEqual((status, text), (0, """\
a.xml: 1 programme, 2 contents, 3 objects, 1 channel, 7 blocks
Main  APR_1001  programme
├─ ナレーション  ACO_1001  content, dialogue
│  └─ o1001  AO_1001  object, from 0:01.000
│     └─ p  AP_00031001  pack, Objects
│        └─ c  AC_00031001  channel, Objects, 7 blocks
│           ├─ throughout  front
│           ├─ from 0:01.000  front
│           ├─ from 0:02.000  front
│           ├─ from 0:03.000  front
│           ├─ from 0:04.000  front
│           └─ … 2 more
└─ Other  ACO_1002  content

In no programme
o1002  AO_1002  object
└─ o1003  AO_1003  object
"""))
        long = self.on_terminal("adm", "a.xml", "--long", NO_COLOR="1")[0]
        self.assertIn("└─ AB_00031001_00000007  from 0:06.000  front\n", long)
        self.assertNotIn("more", long)
        self.assertIn("\x1b[2mAO_1001\x1b[0m", self.on_terminal("adm", "a.xml", NO_COLOR="")[0])
        self.assertEqual(len(self.lines("adm", "a.xml")), 15)  # a pipe gets all blocks
        self.assertEqual(self.lines("adm", "--quiet", "a.xml"), [])

    def test_numbers_beyond_measure(self):
        pack = named("audioPackFormat", "AP_00031001", "p", more='typeLabel="0003" importance="-1"')
        self.write("a.xml", document(
            audio_object("AO_1001", "<gain>1e999</gain>", '<positionOffset coordinate="X">-1e999</positionOffset>',
                         more='importance="-1"'), pack,
            channel(block(1, position(azimuth="1e999", elevation=0), '<gain gainUnit="dB">-1e999</gain>'))))
        self.assertEqual([line.split("\t")[4] for line in self.lines("adm", "a.xml")], [
            "gain ∞, importance -1, moved ∞ left", "Objects, importance -1", "Objects, 1 block",
            "throughout, ∞° left, gain -∞ dB"])
        given = self.record("adm", "a.xml")
        self.assertEqual([given[key][0]["importance"] for key in ("objects", "packFormats")], [-1, -1])
        self.assertNotIn("gain", given["objects"][0])

    def test_circles_and_many_ways(self):
        self.write("circle.xml", document(audio_object("AO_1001", reference("audioObject", "AO_1002", "AO_1001")),
                                          audio_object("AO_1002", reference("audioObject", "AO_1001"))))
        self.assertEqual([line.split("\t") for line in self.lines("adm", "circle.xml")], [
            ["0", "object", "AO_1001", "o1001", ""],
            ["1", "object", "AO_1002", "o1002", ""],
            ["2", "object", "AO_1001", "o1001", "goes round in a circle"],
            ["1", "object", "AO_1001", "o1001", "goes round in a circle"]])
        # Two ways from each to the next: 2^59 of them to the last.
        ladder = [audio_object(f"AO_{i:04X}", reference("audioObject", *[f"AO_{i + 1:04X}"] * 2)) for i in range(59)]
        self.write("ladder.xml", document(*ladder, audio_object("AO_003B")))
        lines = self.lines("adm", "ladder.xml")
        self.assertLess(len(lines), 130)
        self.assertEqual({line.split("\t")[2] for line in lines}, {f"AO_{i:04X}" for i in range(60)})

    def test_deep(self):
        chain = [audio_object(f"AO_{i:04X}", reference("audioObject", f"AO_{i + 1:04X}")) for i in range(60000)]
        self.write("deep.xml", document(*chain, audio_object(f"AO_{60000:04X}")))
        lines = [line.split("\t") for line in self.lines("adm", "deep.xml")]
        self.assertEqual(len({line[2] for line in lines}), 60001)
        self.assertLess(max(int(line[0]) for line in lines), 30)


class Json(CommandTest):
    def test_agrees_with_another_reader(self):
        self.write("t.xml", (MEDIA / "harbour.xml").read_bytes())
        given = self.record("adm", "t.xml")
        root = ElementTree.parse(MEDIA / "harbour.xml").getroot()
        space = "{urn:ebu:metadata-schema:ebuCore_2016}"
        for key, name in (("programmes", "audioProgramme"), ("contents", "audioContent"), ("objects", "audioObject"),
                          ("packFormats", "audioPackFormat"), ("channelFormats", "audioChannelFormat"),
                          ("streamFormats", "audioStreamFormat"), ("trackFormats", "audioTrackFormat"),
                          ("trackUIDs", "audioTrackUID")):
            elements = list(root.iter(space + name))
            self.assertEqual(len(given[key]), len(elements))
            for item, one in zip(given[key], elements):
                identifier = "UID" if name == "audioTrackUID" else name + "ID"
                self.assertEqual(item["audioTrackUIDID" if identifier == "UID" else identifier], one.get(identifier))
                self.assertEqual(item.get(name + "Name"), one.get(name + "Name"))
                for target in ("audioContent", "audioObject", "audioPackFormat", "audioChannelFormat", "audioTrackUID",
                               "audioTrackFormat"):
                    tag = target + ("Ref" if target == "audioTrackUID" else "IDRef")
                    texts = [child.text for child in one.findall(space + tag)]
                    found = item.get(tag + "s", item.get("audioContentIDs" if target == "audioContent" else tag))
                    self.assertEqual(found if isinstance(found, list) else [found] if found else [], texts)
        for item, one in zip(given["channelFormats"], root.iter(space + "audioChannelFormat")):
            blocks = one.findall(space + "audioBlockFormat")
            self.assertEqual([b["audioBlockFormatID"] for b in item["audioBlockFormat"]],
                             [b.get("audioBlockFormatID") for b in blocks])
            for ours, theirs in zip(item["audioBlockFormat"], blocks):
                self.assertAlmostEqual(ours["gain"], float(theirs.findtext(space + "gain", "1")))
                if item["type"] == 3:  # positions of loudspeakers are not taken over
                    for coordinate in theirs.findall(space + "position"):
                        self.assertAlmostEqual(ours["position"][coordinate.get("coordinate")], float(coordinate.text))

    def test_values(self):
        self.write("a.xml", document(
            audio_object("AO_1001", '<gain gainUnit="dB">-1e999</gain><audioObjectLabel language="d&quot;e">Ü"\\</audioObjectLabel>',
                         '<positionOffset coordinate="Y">0.1</positionOffset>'),
            named("audioProgramme", "APR_100F", "p", more='start=""'), named("audioContent", "ACO_1001", "c"),
            '<audioTrackUID UID="atu_0000000a"/>',
            channel(block(1, FRONT, '<jumpPosition>y</jumpPosition>', times='rtime="00:00:01.5"'), block(2, FRONT))))
        given = self.record("adm", "a.xml")
        self.assertEqual(given["programmes"], [{
            "audioProgrammeID": "APR_100F", "index": 0x100F, "audioProgrammeName": "p", "start": 0, "maxDuckingDepth": 0, "audioContentIDs": [], "audioProgrammeLabels": {}}])
        self.assertEqual(given["contents"], [{
            "audioContentID": "ACO_1001", "index": 0x1001, "audioContentName": "c",
            "audioObjectIDRefs": [], "audioContentLabels": {}, "dialogueMode": 2, "nonDialogueContentKind": 0,
            "dialogueContentKind": 0, "mixedContentKind": 0}])
        self.assertEqual(given["trackUIDs"], [{
            "audioTrackUIDID": "atu_0000000a", "index": 10}])
        self.assertEqual(given["objects"], [{
            "audioObjectID": "AO_1001", "audioObjectName": "o1001", "start": 0, "dialogueMode": 2,
            "importance": 10, "interact": False, "disallowDucking": False, "audioPackFormatIDRefs": [],
            "audioObjectIDRefs": [], "audioTrackUIDRefs": [], "audioObjectLabels": {'d"e': 'Ü"\\'},
            "gainUnit": 1, "headLocked": False, "mute": False,
            "polarOffset": {"azimuth": 0, "elevation": 0, "distance": 0}, "cartesianOffset": {"X": 0, "Y": 0.1, "Z": 0}}])
        self.assertEqual(given["channelFormats"][0]["audioBlockFormat"][0], {
            "audioBlockFormatID": "AB_00031001_00000001", "type": 3, "index": 0x1001, "blockIndex": 1, "rtime": 1000050,
            "hasGain": False, "gain": 1, "gainUnit": 0, "importance": 1, "headLocked": False,
            "headphoneVirtualize": False,
            "position": {"cartesian": False, "X": 0, "Y": 0, "Z": 0, "azimuth": 0, "elevation": 0, "distance": 1},
            "hasCartesianX": False, "hasCartesianY": False, "hasCartesianZ": False, "hasPolarAzimuth": True,
            "hasPolarElevation": True, "hasPolarDistance": False, "width": 0, "height": 0, "depth": 0, "hasWidth": False,
            "hasHeight": False, "hasDepth": False, "diffuse": 0, "jumpPosition": True, "interpolationLength": -1,
            "screenRef": False})
        exact = self.record("adm", "a.xml", "--lenient")
        self.assertEqual(exact["channelFormats"][0]["audioBlockFormat"][0]["rtime"], 1500000)
        self.assertEqual(exact["diagnostics"], [])


class Problems(CommandTest):
    def setUp(self):
        super().setUp()
        self.write("bad.xml", document(
            named("audioContent", "ACO_1001", "c", reference("audioObject", "AO_9999")),
            audio_object("AO_1001", "<audioTrackUIDRef>ATU_00000000</audioTrackUIDRef>"),
            channel(block(1, FRONT), "\n ", block(2, kind=2), "\n ", block(3, FRONT))))
        self.matrix = "6:2: UnsupportedDefinition: type '2' not supported for audioBlockFormat"
        self.missing = "3:1: MissingDefinition: 'AO_9999' referenced, but not defined"
        self.silent = "4:1: MissingDefinition: 'ATU_00000000' referenced, but not defined"

    def test_strict(self):
        self.assertEqual(self.failure("adm", "bad.xml"), f"ktfiles: bad.xml:{self.matrix}\n")
        self.assertEqual(self.failure("adm", "bad.xml", "--json").count("\n"), 1)

    def test_lenient(self):
        result = self.run_command("adm", "--lenient", "bad.xml")
        self.assertEqual(result.stderr.decode().splitlines(),
                         [f"ktfiles: bad.xml:{text}" for text in (self.matrix, self.missing)])
        lines = result.stdout.decode().splitlines()
        self.assertIn("1\tmissing\tAO_9999\t\t", lines)
        self.assertIn("1\tsilent track\tATU_00000000\t\t", lines)
        self.assertEqual(sum("\tblock\t" in line for line in lines), 2)
        diagnostics = self.record("adm", "--lenient", "bad.xml")["diagnostics"]
        self.assertEqual([(d["line"], d["elementID"]) for d in diagnostics],
                         [(6, "AB_00021001_00000002"), (3, "ACO_1001")])
        # What has no opt-in stays an error.
        self.write("prefix.xml", document(named("audioProgramme", "ACO_1001", "p")))
        self.assertIn("WrongIDPrefix", self.failure("adm", "--lenient", "prefix.xml"))
        self.write("both.xml", (self.folder / "bad.xml").read_bytes()[:-9])
        errors = self.run_command("adm", "--lenient", "both.xml", status=1).stderr.decode().splitlines()
        self.assertEqual([error.split(": ")[2] for error in errors], ["UnsupportedDefinition", "ParseError"])

    def test_check(self):
        self.write("good.xml", document(audio_object("AO_1001")))
        self.write("cut.xml", document(audio_object("AO_1001"))[:-5])
        self.assertEqual(self.lines("adm", "--check", "good.xml", str(HARBOUR)), [])
        self.assertEqual(self.lines("adm", "--check", "good.xml", "bad.xml", status=1),
                         [f"bad.xml:{text}" for text in (self.matrix, self.missing, self.silent)])
        self.assertEqual(len(self.lines("adm", "--check", "--lenient", "bad.xml", status=1)), 2)
        self.assertRegex(self.lines("adm", "--check", "cut.xml", status=1)[0], r"^cut\.xml:\d+:\d+: ParseError: .")
        self.assertEqual(self.lines("adm", "--check", "--quiet", "bad.xml", status=1), [])
        self.assertEqual([len(item["problems"]) for item in self.json("adm", "--check", "good.xml", "bad.xml", status=1)],
                         [0, 3])
        self.failure("adm", "--check", "missing.xml")


class Check(CommandTest):
    def problems(self, content, name="a.xml", status=1):
        self.write(name, content)
        return [line.removeprefix(f"{name}:") for line in self.lines("adm", "--check", name, status=status)]

    def test_no_elements(self):
        nothing = " NoElements: no ADM elements"
        self.assertEqual(self.problems(b"<html><body><p/></body></html>"), [nothing])
        self.assertEqual(self.problems(b"<audioFormatExtended/>"), [nothing])
        self.assertEqual(self.problems(wave(chunk(b"axml", b"<x/>")), "a.wav"), [nothing])
        prefixed = b'<a:x xmlns:a="u">\n<a:audioObject/><a:audioContent/>\n<a:title/></a:x>'
        self.assertEqual(self.problems(prefixed),
                         ["2:1: PrefixedName: 'a:audioObject' has a prefix, and is not read, like another of 2 names",
                          nothing])
        self.assertEqual(self.problems(document(audio_object("AO_1001")) + b"<", "cut.xml")[0].split(": ")[1],
                         "ParseError")  # and nothing of what may stand behind it

    def test_duplicates_and_times(self):
        times = ('rtime="00:00:01" duration="00:00:01.00000"', 'rtime="1.5"', 'rtime=""', 'rtime="00:00:00.10000S48000"')
        self.assertEqual(self.problems(document(
            audio_object("AO_1001"), audio_object("AO_1001", more='start="soon"'),
            channel(*("\n" + block(i % 3, FRONT, times=time) for i, time in enumerate(times))),
            channel(block(1, FRONT)).replace("AC_00031001", "AC_00031002"))), [
                "4:1: DuplicateID: 'AO_1001' is defined more than once", "4:1: UnreadableTime: start 'soon' is no time",
                "6:1: UnreadableTime: rtime '00:00:01' is no time", "7:1: UnreadableTime: rtime '1.5' is no time",
                "9:1: DuplicateID: 'AB_00031001_00000000' is defined more than once"])
        # Also behind what ends the reading of the elements.
        self.assertEqual([line.split(": ")[1] for line in self.problems(document(
            '<audioObject audioObjectID="AO_1"/>', audio_object("AO_1001"), audio_object("AO_1001")))],
            ["MalformedDefinition", "DuplicateID"])

    def test_tracks(self):
        def chna(*entries, tracks=None, uids=None):
            body = b"".join(struct.pack("<H12s14s11sx", track, *(text.encode() for text in texts))
                            for track, *texts in entries)
            used = {track for track, *_ in entries if track}
            return chunk(b"chna", struct.pack("<HH", len(used) if tracks is None else tracks,
                                              len(entries) if uids is None else uids) + body)

        xml = document(
            element("audioTrackUID", 'UID="ATU_0000000a"', reference("audioTrackFormat", "AT_00031001_01"),
                    reference("audioPackFormat", "AP_00031001")),
            named("audioTrackFormat", "AT_00031001_01", "t"), named("audioPackFormat", "AP_00031001", "p", more='typeLabel="0003"'))
        one = (1, "ATU_0000000A", "AT_00031001_01", "AP_00031001")
        for chunks, problems in (
                ([chna(one)], []),
                ([chna(one, (0, "", "", ""))], []),
                ([chna((1, "ATU_0000000A", "", ""))], []),
                ([], [" TrackMismatch: no chunk \"chna\" tells where the tracks are"]),
                ([chna((2, *one[1:]))],
                 [" TrackMismatch: the chunk \"chna\" has 'ATU_0000000A' in track 2, and the file 1 channel"]),
                ([chna(one, one)], [" TrackMismatch: the chunk \"chna\" has 'ATU_0000000A' more than once"]),
                ([chna(one, tracks=2)], [" TrackMismatch: the chunk \"chna\" counts 2 tracks, and uses 1"]),
                ([chna(one, uids=3)], [" TrackMismatch: the chunk \"chna\" claims 3 entries, and has room for 1"]),
                ([chna((1, "ATU_00000001", "", ""))],
                 ["3:1: TrackMismatch: 'ATU_0000000a' is not in the chunk \"chna\"",
                  " TrackMismatch: 'ATU_00000001' of the chunk \"chna\" is not defined"]),
                ([chna((1, "ATU_0000000A", "AT_00031002_01", "AP_00031002"))],
                 [f"3:1: TrackMismatch: 'ATU_0000000a' is of '{here}', and of '{there}' in the chunk \"chna\""
                  for here, there in (("AT_00031001_01", "AT_00031002_01"), ("AP_00031001", "AP_00031002"))]),
                ([chunk(b"chna", b"\1\0\1")],
                 [" TrackMismatch: the chunk \"chna\" has 3 bytes, too few for its header",
                  "3:1: TrackMismatch: 'ATU_0000000a' is not in the chunk \"chna\""])):
            with self.subTest(problems):
                self.assertEqual(self.problems(wave(chunk(b"axml", xml), *chunks), "a.wav", status=1 if problems else 0),
                                 problems)

    def test_messages_stay_on_one_line(self):
        self.write("a.xml", b"<a>\xff</a>")
        self.assertNotIn("\\x0A", self.failure("adm", "a.xml"))
        self.assertNotIn("\n", self.record("adm", "--check", "a.xml", status=1)["problems"][0]["reason"])


class Large(CommandTest):
    def test_long_names_are_not_repeated(self):
        """Many elements that refer to one with a very long name, or stand in one with a very long ID."""
        long = "é" * 3500
        self.write("name.xml", document(
            audio_object("AO_1001", reference("audioObject", *["AO_1002"] * 3000)), audio_object("AO_1002").replace("o1002", long),
            *(element("audioTrackUID", f'UID="ATU_{i:08X}"', reference("audioTrackFormat", "AT_00010001_01")) for i in range(3000)),
            named("audioTrackFormat", "AT_00010001_01", long, reference("audioStreamFormat", "AS_00010001")),
            named("audioStreamFormat", "AS_00010001", long, more='formatLabel="0001"')))
        text = self.run_command("adm", "name.xml").stdout.decode()
        self.assertIn(f"AO_1002\t{long[:100]}…\tsee above", text)
        self.assertLess(len(text), 2_000_000)
        self.write("id.xml", document(audio_object("AO_" + long, reference("audioObject", *["AO_1"] * 3000))))
        problems = self.record("adm", "--check", "id.xml", status=1)["problems"]
        self.assertEqual({len(problem["elementID"]) for problem in problems}, {102})

    def test_memory_is_that_of_the_document(self):
        """A chunk of which most is no ADM element is never held whole."""
        self.write("a.wav", wave(chunk(b"axml", b"<x>" + b"<y>filler</y>" * 4_000_000 + b"</x>")))
        script = ('import resource, subprocess, sys; subprocess.run(sys.argv[1:], check=True, stdout=subprocess.DEVNULL);'
                  'print(resource.getrusage(resource.RUSAGE_CHILDREN).ru_maxrss)')
        peak = subprocess.run(["python3", "-c", script, KTFILES, "adm", "--json", str(self.folder / "a.wav")],
                              check=True, capture_output=True).stdout
        self.assertLess(int(peak), 32 * 1024 if not re.search("asan|tsan", KTFILES) else 400 * 1024)


if __name__ == "__main__":
    unittest.main()
