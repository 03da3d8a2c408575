"""What `coverage.sh` reports: which lines and branches of the library and the command no test has run.

    coverage.py BUILD_FOLDER     from the root of the sources

A line counts if the compiler made code of it and it has a word, not only brackets. A branch is one outcome of a decision
that stands in the source: "if", "?", "&&", "||", a loop, "switch", "catch". What the compiler adds is none: the way of an
exception out of a call and what is cleaned up on it, the guard of a local static, the null of a "delete". Code that is
compiled several times, as templates and inline functions are, counts once: a line or a branch is run if one of its copies is.
"""

import collections
import multiprocessing
import os
import re
import subprocess
import sys

PARTS = ("kvt/", "tools/")
WORD = re.compile(r"\w")
DECIDES = re.compile(r"\b(if|for|while|do|switch|catch)\b|\?|&&|\|\|")
GOES_ON = re.compile(r"(\?|&&|\|\|)\s*$")
GUARDED = re.compile(r"\s*(inline )?(static|thread_local)\b")
COMMENT = re.compile(r"//.*")

# What gcov writes: "COUNT: LINE:SOURCE" for a line, "COUNT: LINE-block N" for each of its blocks, and below a block its ways out.
ROW = re.compile(r" *([^ :]+): *(\d+)([-:])(.*)")
SOURCE = re.compile(r" *-: *0:Source:(.*)")
WAY_OUT = re.compile(r"branch +\d+ (?:taken (\d+)(?: \((fallthrough|throw)\))?|never executed)")
NEVER_RUN = ("#####", "=====", "%%%%%", "$$$$$")
ONLY_BY_EXCEPTIONS = "$$$$$"


def read_notes(notes):
    """What gcov says of one object: {(file, line): count}, and {(file, line): counts of its branches} for copies that are run
    and for those that are not. Of lines that are inlined into several copies of a function it knows no branches."""
    gcov = subprocess.run(["gcov", "--stdout", "--all-blocks", "--branch-probabilities", "--branch-counts", notes],
                          capture_output=True, text=True)
    if gcov.returncode != 0: # such as counts of what was compiled before
        raise RuntimeError(gcov.stderr)
    lines, branches, unrun = collections.Counter(), {}, {}
    key, line_is_run, ways, found = None, False, [], {}

    def end_block():
        # A call that can throw has two ways out, and so has what only cleans up after one that threw.
        if len(ways) > 1 and not any(kind == "throw" for _, kind in ways):
            found.setdefault((key, line_is_run), []).extend(count for count, _ in ways)
        ways.clear()

    def end_copy():
        for (at, is_run), counts in found.items():
            add(branches if is_run else unrun, at, counts)
        found.clear()

    name = None
    skips = True
    for text in gcov.stdout.splitlines():
        if source := SOURCE.match(text):
            end_block()
            end_copy()
            name = os.path.relpath(source[1])
            if not name.startswith(PARTS):
                name = None
        elif name is None:
            continue
        elif row := ROW.match(text):
            end_block()
            count, line, mark, _ = row.groups()
            if mark == ":":
                key = (name, int(line))
                line_is_run = count not in NEVER_RUN
                if count != "-" and line != "0":
                    lines[key] += int(count.rstrip("*")) if line_is_run else 0
            else:
                skips = count == ONLY_BY_EXCEPTIONS and line_is_run
        elif way := WAY_OUT.match(text):
            if not skips:
                ways.append((int(way[1] or 0), way[2]))
        elif text.startswith("-----"): # the next copy of what is compiled several times
            end_block()
            end_copy()
    end_block()
    end_copy()
    return lines, branches, unrun


def add(branches, key, counts):
    known = branches.setdefault(key, [])
    known.extend([0] * (len(counts) - len(known)))
    for at, count in enumerate(counts):
        known[at] += count


def decides(texts, number):
    """Whether a decision stands in the line, or the condition of the line before goes on in it."""
    text, before = (COMMENT.sub("", texts[at]) for at in (number - 1, max(number - 2, 0)))
    return bool(DECIDES.search(text) or GOES_ON.search(before)) and not GUARDED.match(text)


def read_reasons():
    """{(file, line of the source without blanks around it): how many lines from there on no test can run}"""
    with open("tests/trust/lines_that_no_test_can_run.tsv", encoding="utf-8") as file:
        rows = [row.split("\t") for row in file.read().splitlines()[1:]]
    return {(name, line): int(count) for name, line, count, _ in rows}


def excused(reasons, name, texts, number):
    """Whether the line stands in the list, or among the lines that a row of it stands for."""
    return any(reasons.get((name, texts[at].strip()), 0) > number - 1 - at for at in range(max(number - 60, 0), number))


def main(folder):
    found = [os.path.join(where, name) for where, _, names in os.walk(folder) for name in names if name.endswith(".gcno")]
    lines, branches, unrun = collections.Counter(), {}, {}
    with multiprocessing.Pool() as pool:
        for some_lines, some_branches, some_unrun in pool.imap_unordered(read_notes, sorted(found)):
            lines.update(some_lines)
            for key, counts in some_branches.items():
                add(branches, key, counts)
            for key, counts in some_unrun.items():
                add(unrun, key, counts)
    branches.update({key: counts for key, counts in unrun.items() if lines[key] == 0})

    texts = {name: open(name, encoding="utf-8").read().split("\n") for name in {name for name, _ in lines}}
    lines = {key: count for key, count in lines.items() if WORD.search(texts[key[0]][key[1] - 1])}
    branches = {key: counts for key, counts in branches.items() if key in lines and decides(texts[key[0]], key[1])}

    figures = collections.defaultdict(lambda: [0, 0, 0, 0]) # lines, run, branches, taken; of a file, and of a part
    left_out = []
    reasons = read_reasons()
    for (name, line), count in lines.items():
        for of in (name, name[:name.index("/") + 1]):
            figures[of][0] += 1
            figures[of][1] += count > 0
        if count == 0:
            left_out.append((name, line, "line with a reason" if excused(reasons, name, texts[name], line) else "line"))
    for (name, line), counts in branches.items():
        taken = sum(count > 0 for count in counts)
        for of in (name, name[:name.index("/") + 1]):
            figures[of][2] += len(counts)
            figures[of][3] += taken
        if taken < len(counts) and lines[name, line] > 0:
            missing = [str(at + 1) for at, count in enumerate(counts) if count == 0]
            left_out.append((name, line, f"branch {' '.join(missing)} of {len(counts)}"))

    def write(path, first, names):
        with open(path, "w", encoding="utf-8") as file:
            print(first, "lines", "run", "of 100 lines", "branches", "taken", "of 100 branches", sep="\t", file=file)
            for name in names:
                count, run, outcomes, taken = figures[name]
                print(name, count, run, f"{100 * run / count:.2f}", outcomes, taken,
                      f"{100 * taken / max(outcomes, 1):.2f}", sep="\t", file=file)

    write(f"{folder}/files.tsv", "file", sorted(texts, key=lambda name: figures[name][1] + figures[name][3]
                                                 - figures[name][0] - figures[name][2]))
    write("tests/trust/coverage.tsv", "part", [part for part in PARTS if part in figures])
    unexcused = sum(what == "line" for _, _, what in left_out)
    print(f"coverage: {unexcused} lines are left out without a reason", file=sys.stderr)
    with open(f"{folder}/left_out.tsv", "w", encoding="utf-8") as file:
        for name, line, what in sorted(left_out):
            print(f"{name}:{line}", what, texts[name][line - 1].strip(), sep="\t", file=file)


main(*sys.argv[1:])
