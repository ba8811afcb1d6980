"""The small faults that scripts/mutate puts into a C++ source. A fault never changes the number of lines."""
import dataclasses
import random
import re


@dataclasses.dataclass(frozen=True)
class Mutation:
    """The bytes [start, end) of a source become `text`; `operator` says by which rule."""
    operator: str
    start: int
    end: int
    text: str

    def apply(self, source):
        return source[:self.start] + self.text + source[self.end:]

    def line(self, source):
        """The number of the first line that changes, from 1 on."""
        return source.count("\n", 0, self.start) + 1

    def lines(self, source):
        """The line as it is, and as it becomes, both without their margins: what names a mutation while code moves."""
        first = source.rfind("\n", 0, self.start) + 1
        last = source.find("\n", self.end)
        last = len(source) if last < 0 else last
        old = source[first:last]
        new = self.apply(source)[first:len(source[:last]) + len(self.text) - (self.end - self.start)]
        return " ".join(old.split()), " ".join(new.split())


HIDDEN = re.compile(r"""//[^\n]*|/\*.*?\*/|R"(?P<fence>[^(\s]*)\(.*?\)(?P=fence)"|"(?:\\.|[^"\\\n])*"|'(?:\\.|[^'\\\n])+'"""
                    r"""|\b\d[\w'.]*|^[ \t]*\#(?:\\\n|[^\n])*""", re.S | re.M)


def hide(source):
    """The source with blanks for comments, texts, characters and directives; every place stays where it was."""
    def blanks(match):
        found = match.group()
        if found[0].isdigit():
            return found
        inside = re.sub(r"[^\n]", " ", found)
        return '"' + inside[1:-1] + '"' if found[0] in "\"'" or found.startswith('R"') else inside
    return HIDDEN.sub(blanks, source)


COMPARISONS = {"==": ["!="], "!=": ["=="], "<": ["<=", ">="], "<=": ["<", ">"], ">": [">=", "<="], ">=": [">", "<"]}
INTEGER = re.compile(r"(?<![\w.'])(0[xX][\da-fA-F']+|\d[\d']*)([uUlLzZ]*)(?![\w.'])")
# A line that begins a statement: what stands ahead of it ended one, opened or closed a block, or is a condition.
BEGINNING = re.compile(r"(?<=\n)[ \t]{4,}(?=[\w*+(-])")
# Expressions that are statements: calls, assignments, increments. `Type name` and what else declares does not match.
EXPRESSION = re.compile(r"(?:[*+(-]*)(?!(?:return|if|for|while|switch|do|else|case|default|using|throw|goto|static_assert|"
                        r"break|continue)\b)[A-Za-z_][\w:]*(?:\(|\[|\.|->|\+\+|--|;|\s(?:[-+*/%|&^]|<<|>>)?=\s|\s<<\s)")
CONTROL = re.compile(r"(?:if|for|while|switch) \(|(?:const )?auto[&*]* ")


def statement_end(code, start):
    """The end of the statement that begins at `start`, behind its semicolon; None where it holds a block."""
    depth = 0
    for place in range(start, len(code)):
        character = code[place]
        if character in "([":
            depth += 1
        elif character in ")]":
            depth -= 1
        elif character in "{}":
            return None
        elif character == ";" and depth == 0:
            return place + 1
    return None


def statements(code):
    """Of every statement: its beginning, and whether it is the whole of what an `if` or a loop does."""
    for match in BEGINNING.finditer(code):
        ahead = code[:match.start()].rstrip()[-1:]
        if ahead in (";", "{", "}", ":", ")"):
            yield match.end(), ahead == ")"


def early_return(code, start):
    """`return {}` where the rest of the function returns something, else `return`."""
    end = code.find("\n}", start)
    return "return {};" if re.search(r"\breturn\b\s*[^\s;]", code[start:end]) else "return;"


def mutations(source):
    """Every mutation of the source, by operator, in the order of their places."""
    code = hide(source)
    found = {name: [] for name in ("break", "integer", "statement", "logic", "return", "comparison")}

    def add(operator, start, end, text):
        line = code[code.rfind("\n", 0, start) + 1:code.find("\n", start)]
        if "static_assert" not in line:
            found[operator].append(Mutation(operator, start, end, text))

    for match in re.finditer(r"\bbreak;", code):
        add("break", match.start(), match.end(), ";")
    for match in INTEGER.finditer(code):
        digits, suffix = match.groups()
        plain = digits.replace("'", "")
        octal = len(plain) > 1 and plain[0] == "0" and plain.isdigit()
        value = int(plain, 8 if octal else 0)
        for other in (value + 1, value - 1):
            if other >= 0:
                add("integer", match.start(), match.end(), format(other, "#x" if "x" in plain.lower() else "d") + suffix)
    for match in re.finditer(r"(?<= )(&&|\|\|)(?= |\n)", code):
        add("logic", match.start(), match.end(), "||" if match.group() == "&&" else "&&")
    for match in re.finditer(r"(?<= )(==|!=|<=|>=|<|>)(?= )", code):
        for other in COMPARISONS[match.group()]:
            add("comparison", match.start(), match.end(), other)
    for start, whole in statements(code):
        expression = EXPRESSION.match(code, start)
        end = statement_end(code, start) if expression else None
        if end and ".reserve(" not in code[start:end]:  # memory that is taken later is the same memory
            add("statement", start, end, ";" + "\n" * code.count("\n", start, end))
        if not whole and (end or CONTROL.match(code, start)):
            add("return", start, start, early_return(code, start) + " ")
    return found


def drawn(sources, seed, allowed=lambda path, line: True):
    """(path, mutation) of the sources, a dictionary from path to text, in the order of the seed: the operators take turns,
    and each gives its own in random order."""
    rng = random.Random(seed)
    stacks = {}
    for path in sorted(sources):
        for operator, some in mutations(sources[path]).items():
            stacks.setdefault(operator, []).extend(
                (path, one) for one in some if allowed(path, one.line(sources[path])))
    for stack in stacks.values():
        rng.shuffle(stack)
    while any(stacks.values()):
        for operator in sorted(stacks):
            if stacks[operator]:
                yield stacks[operator].pop()
