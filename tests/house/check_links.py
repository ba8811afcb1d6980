"""Checks that every local link of README.md, CONTRIBUTING.md and docs/**/*.md leads to something that is there, headings included, and every
one of the HTML pages in a folder: check_links.py TREE [PAGES]

Doxygen links to places that it leaves out (nested classes that are private), so that within pages only its links from the guide are followed."""
import html.parser
import pathlib
import re
import sys
import urllib.parse

LINK = re.compile(r"!?\[[^\]]*\]\(<?([^)\s>]+)>?(?:\s+\"[^\"]*\")?\)")


def prose(text):
    """The text without code."""
    return re.sub(r"(`+)[^`\n]+?\1", "", re.sub(r"^(```|~~~).*?^\1$", "", text, flags=re.M | re.S))


def headings(path):
    """The names by which headings of a Markdown file are linked to."""
    lines = re.findall(r"^#+ +(.+?) *#*$", re.sub(r"^```.*?^```$", "", path.read_text(encoding="utf-8"), flags=re.M | re.S), re.M)
    return {re.sub(r"[^\w\- ]", "", line.lower()).replace(" ", "-") for line in lines}


class Page(html.parser.HTMLParser):
    """The links and the anchors of a page."""

    def __init__(self, path):
        super().__init__()
        self.links, self.anchors = set(), set()
        self.feed(path.read_text(encoding="utf-8", errors="replace"))

    def handle_starttag(self, tag, attributes):
        for name, value in attributes:
            if name in ("href", "src") and value:
                self.links.add(value)
            elif name in ("id", "name") and value:
                self.anchors.add(value)


def problem_of(path, link, anchors_of):
    """Why a link in a file leads nowhere; None when it leads somewhere or out of the tree."""
    target = urllib.parse.urlsplit(link)
    if target.scheme or target.netloc or link == "#":
        return None
    there = path.parent / urllib.parse.unquote(target.path) if target.path else path
    if not there.exists():
        return "nothing is there"
    if target.fragment and there.suffix == path.suffix and urllib.parse.unquote(target.fragment) not in anchors_of(there):
        return "nothing in it has that name"
    return None


def main():
    tree = pathlib.Path(sys.argv[1])
    problems, count = [], 0
    for path in [tree / "README.md", tree / "CONTRIBUTING.md", *sorted((tree / "docs").rglob("*.md"))]:
        for link in LINK.findall(prose(path.read_text(encoding="utf-8"))):
            count += 1
            if problem := problem_of(path, link, headings):
                problems.append(f"{path}: {link}: {problem}")
    if len(sys.argv) > 2:
        pages = {path: Page(path) for path in sorted(pathlib.Path(sys.argv[2]).glob("*.html"))}
        for path, page in pages.items():
            for link in sorted(page.links):
                count += 1
                if not path.name.startswith(("index", "md_")):
                    link = link.split("#")[0]
                if not link.startswith("javascript:") and (problem := problem_of(path, link, lambda there: pages[there].anchors)):
                    problems.append(f"{path}: {link}: {problem}")
    if count < 40:
        problems.append(f"only {count} links found")
    print("\n".join(problems) or f"{count} links lead somewhere")
    sys.exit(1 if problems else 0)


main()
