"""What README.md and the man page tell people to type, typed: every example works as it stands, and shows what they say."""
import pathlib
import re
import shutil
import subprocess
import unittest

from command import needs_decoders
from picture import decoded_png
from typed import TypedTest, blocks, shown

ROOT = pathlib.Path(__file__).resolve().parents[2]
README = (ROOT / "README.md").read_text(encoding="utf-8")


def examples():
    """What the man page's section EXAMPLES has in displays, as a terminal shows it to whoever copies a line."""
    page = subprocess.run(["groff", "-mdoc", "-Tutf8", "-P-cbou", ROOT / "tool/ktfiles.1"], capture_output=True, text=True, check=True).stdout
    section = re.search(r"^EXAMPLES\n(.*?)^\S", page, re.S | re.M).group(1)
    return [line.strip() for line in section.splitlines() if line.startswith(" " * 9)]


class DocumentsTest(TypedTest):
    @needs_decoders
    def test_the_readme_shows_what_its_commands_show(self):
        for_each_user = re.findall(r"^\| \*\*.*\| `(ktfiles [^`]+)` \|$", README, re.M)
        self.assertEqual(len(for_each_user), 3)
        for command in for_each_user:
            self.assert_works(command)
        self.assertGreater(len(shown(README)), 10)
        self.assert_shows("README.md", README)

    def test_the_picture_of_the_readme_is_what_is_drawn(self):
        name = re.search(r"!\[.*\]\((docs/.*\.png)\)", README).group(1)
        drawing = next(command for command, _ in shown(README) if "--png" in command)
        self.typed(drawing)
        drawn = self.folder / re.search(r"--png (\S+)", drawing).group(1)
        self.assertTrue(decoded_png(drawn.read_bytes()) == decoded_png((ROOT / name).read_bytes()), f"{drawing} draws another")

    def test_on_a_machine_with_nothing_the_commands_install_or_say_the_line_to_install(self):
        """A machine of its own: the scripts find no program but these, no package, and what they install they only call."""
        programs = self.folder / "bin"
        programs.mkdir()
        for name in ("bash", "env", "dirname", "grep"):
            (programs / name).symlink_to(shutil.which(name))

        def stub(name, script):
            (programs / name).write_text(f"#!{shutil.which('bash')}\n{script}\n", encoding="utf-8")
            (programs / name).chmod(0o755)

        def complaint(command, status):
            result = subprocess.run([ROOT / command], env={"PATH": str(programs)}, capture_output=True, text=True)
            self.assertEqual(result.returncode, status, result.stderr)
            return result.stderr

        stub("dpkg-query", "exit 1")
        stub("apt-get", f'echo "$@" >> {self.folder}/called; [ "$1" = update ] || exit 100')
        for command in ("scripts/run", "scripts/test"):
            stub("id", "echo 1000")
            for sudo in (None, "exit 1"):  # there is none; this user may not use it
                if sudo:
                    stub("sudo", sudo)
                self.assertRegex(complaint(command, 1), r"\napt-get update && apt-get install -y .*\bg\+\+ .*\bmake\b.*\n$")
            self.assertFalse((self.folder / "called").exists())
            for user, sudo in (("1000", '"$@"'), ("0", "exit 1")):
                stub("id", f"echo {user}")
                stub("sudo", sudo)
                complaint(command, 100)
                self.assertRegex((self.folder / "called").read_text(), r"^update -qq\ninstall -y .*\bg\+\+ .*\bmake\b")
                (self.folder / "called").unlink()
            (programs / "sudo").unlink()

    def test_the_code_in_the_readme_compiles(self):
        for language, compiler in (("cpp", ["g++", "-std=c++20", "-xc++"]), ("c", ["gcc", "-std=c99", "-pedantic", "-xc"])):
            for lines in blocks(README, language):
                includes = [line for line in lines if line.startswith("#include")]
                program = "\n".join([*includes, "int main(void) {", *(line for line in lines if line not in includes), "}"])
                subprocess.run([*compiler, "-fsyntax-only", "-Wall", "-Wextra", "-Werror", "-I", ROOT / "src", "-I", ROOT / "c", "-"],
                               input=program, text=True, check=True)

    def assert_works(self, command):
        result = subprocess.run(["bash", "-c", f"set -o pipefail; {command}"], cwd=self.folder, env=self.environment, capture_output=True,
                                stdin=subprocess.DEVNULL, timeout=60)
        self.assertEqual(result.returncode, 0, f"{command}: {result.stderr.decode(errors='replace')}")
        if "jq" in command:  # which is content with a filter that lets nothing through
            self.assertTrue(result.stdout.strip(), command)

    @needs_decoders
    def test_examples_of_the_man_page_work_when_they_are_copied(self):
        synopsis = (ROOT / "tool/ktfiles.1").read_text(encoding="utf-8").split(".Sh DESCRIPTION")[0]
        commands = examples()[2:]  # behind those that copy the installed files
        for command, _ in shown(README):  # whoever went through the README first is as well served
            self.typed(command)
        for verb in set(re.findall(r"^\.Cm (.+)$", synopsis, re.M)):
            self.assertTrue([line for line in commands if f"ktfiles {verb}" in line], f"no example of {verb}")
        for command in commands:
            self.assert_works(command)


if __name__ == "__main__":
    unittest.main()
