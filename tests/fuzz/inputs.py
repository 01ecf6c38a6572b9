#!/usr/bin/env python3
"""Reads and writes tests/fuzz/inputs/NAME.txt: the inputs that fuzz-NAME starts from, one a line, in lower-case
hexadecimal, sorted, each once.

    inputs.py unpack NAME FOLDER    writes each input to a file in FOLDER, named after its line number
    inputs.py add NAME FILE...      adds the content of files
    inputs.py replace NAME FILE...  replaces all inputs by the content of files

The empty input has no line: every fuzzer runs it first.
"""

import os
import pathlib
import re
import sys

LONGEST = 128  # bytes; scripts/checks/fuzz passes it as -max_len, and libFuzzer truncates a longer input
FOLDER = pathlib.Path(os.path.relpath(os.path.dirname(os.path.realpath(__file__)))) / "inputs"


def read(text):
    """The lines of a text; exits with a message that names the first malformed one."""
    lines = text.read_text(encoding="ascii", errors="replace").splitlines()
    if not lines:
        sys.exit(f"{text}: there are no inputs")
    before = ""
    for number, line in enumerate(lines, 1):
        if not re.fullmatch("([0-9a-f]{2})+", line):
            problem = "not pairs of lower-case hexadecimal digits"
        elif len(line) > 2 * LONGEST:
            problem = f"longer than {LONGEST} bytes"
        elif line == before:
            problem = "the same as the line before"
        elif line < before:
            problem = "not sorted: less than the line before"
        else:
            before = line
            continue
        sys.exit(f"{text}:{number}: {problem}")
    return lines


def contents(files):
    """The contents of files as lines; exits with a message that names the first file that cannot be an input."""
    for file in files:
        content = pathlib.Path(file).read_bytes()
        if not content:
            sys.exit(f"{file}: empty; every fuzzer runs the empty input first")
        if len(content) > LONGEST:
            sys.exit(f"{file}: longer than {LONGEST} bytes")
        yield content.hex()


def main():
    if len(sys.argv) < 4 or sys.argv[1] not in ("unpack", "add", "replace"):
        sys.exit(__doc__)
    action, name, *paths = sys.argv[1:]
    text = FOLDER / f"{name}.txt"
    try:
        before = read(text)
        if action == "unpack":
            folder = pathlib.Path(paths[0])
            folder.mkdir(parents=True)
            for number, line in enumerate(before, 1):
                (folder / str(number)).write_bytes(bytes.fromhex(line))
            return
        after = set(contents(paths))
        if action == "add":
            after.update(before)
        text.write_text("".join(f"{line}\n" for line in sorted(after)), encoding="ascii")
        print(f"{text}: {len(before)} inputs before, {len(after)} now")
    except OSError as error:
        sys.exit(f"{error.filename}: {error.strerror}")


if __name__ == "__main__":
    main()
