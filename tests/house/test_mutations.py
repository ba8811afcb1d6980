#!/usr/bin/env python3
"""scripts/mutations.py: which faults are put where. A mutation in a comment, or of a declaration, would cost a build for nothing."""
import os
import sys
import unittest

sys.dont_write_bytecode = True
sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "scripts"))
import mutations  # noqa: E402

SOURCE = '''#include <map>
#if 1 && defined(__linux__)
#endif
// a comment: a == b && 7;
int find(const std::vector<int>&& numbers, char separator = ';')
{
    static_assert(sizeof(int) == 4);
    const char* text = "a < b; 9";
    int count = 0x0F;
    switch (numbers[010]) {
    case 'a':
        count += 1'000;
        break;
    default:
        call(numbers,
             2.5);
    }
    if (count <= 8 &&
        text != nullptr)
        count = 0;
    return count;
}

void nothing()
{
    std::sort(a, b);
}
'''


class MutationsTest(unittest.TestCase):
    def setUp(self):
        self.found = mutations.mutations(SOURCE)

    def lines(self, operator):
        return [one.lines(SOURCE) for one in self.found[operator]]

    def test_every_operator_finds_its_places_and_no_others(self):
        self.assertEqual(self.lines("break"), [("break;", ";")])
        self.assertEqual([new for _, new in self.lines("integer")], [
            "int count = 0x10;", "int count = 0xe;", "switch (numbers[9]) {", "switch (numbers[7]) {", "count += 1001;", "count += 999;",
            "if (count <= 9 &&", "if (count <= 7 &&", "count = 1;"])
        self.assertEqual(self.lines("logic"), [("if (count <= 8 &&", "if (count <= 8 ||")])
        self.assertEqual([new for _, new in self.lines("comparison")],
                         ["if (count < 8 &&", "if (count > 8 &&", "text == nullptr)"])
        self.assertEqual([old for old, _ in self.lines("statement")],
                         ["count += 1'000;", "call(numbers, 2.5);", "count = 0;", "std::sort(a, b);"])
        self.assertEqual([new for _, new in self.lines("return")], [
            "return {}; switch (numbers[010]) {", "return {}; count += 1'000;", "return {}; call(numbers,", "return {}; if (count <= 8 &&",
            "return; std::sort(a, b);"])

    def test_a_mutant_differs_and_has_as_many_lines(self):
        for some in self.found.values():
            for one in some:
                mutant = one.apply(SOURCE)
                self.assertNotEqual(mutant, SOURCE)
                self.assertEqual(mutant.count("\n"), SOURCE.count("\n"), one)

    def test_the_seed_decides_and_operators_take_turns(self):
        def draw(seed):
            return list(mutations.drawn({"a.cpp": SOURCE, "b.cpp": SOURCE}, seed))
        self.assertEqual(draw(1), draw(1))
        self.assertNotEqual(draw(1), draw(2))
        self.assertEqual(len({one.operator for _, one in draw(1)[:6]}), 6)
        self.assertEqual(len(draw(1)), 2 * sum(map(len, self.found.values())))
        lines = {one.line(SOURCE) for path, one in mutations.drawn({"a.cpp": SOURCE}, 1, lambda path, line: line == 12)}
        self.assertEqual(lines, {12})


if __name__ == "__main__":
    unittest.main()
