#!/usr/bin/env python3
"""Counts the instructions that the most common operations execute in the library, the stand-ins and their caller.

Instructions of the C and C++ libraries do not count, because those choose their code by the processor. Counts also what
a program executes to load the three libraries, then in the C library too, and the bytes of libIC.so's instructions and
constants. The counts are compared with a table of earlier ones; with --update they replace it.
"""

import argparse
import concurrent.futures
import math
import os
import pathlib
import re
import subprocess
import sys
import tempfile

TOLERANCE = 0.03
RUNS = (1000, 2000)  # the difference leaves out what the program does besides the operation
LOAD = "load-libraries"
SIZE = "size-of-libIC.so"
OURS = re.compile(r"/(libIC|libZQ|libVXLog)\.so[.\d]*$|/instructions$")


def executed(program, operation, count):
    """The number of instructions executed in the library, the stand-ins and the program."""
    with tempfile.TemporaryDirectory() as folder:
        profile = pathlib.Path(folder, "profile")
        subprocess.run(
            ["valgrind", "--tool=callgrind", f"--callgrind-out-file={profile}", program, operation, str(count)],
            check=True, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        total = 0
        objects = {}
        ours = False
        called = False
        for line in profile.read_text().splitlines():
            if match := re.match(r"ob=(\(\d+\))(?: (.*))?$", line):
                if match[2]:
                    objects[match[1]] = match[2]
                ours = OURS.search(objects[match[1]]) is not None
            elif match := re.match(r"cob=(\(\d+\))(?: (.*))?$", line):
                if match[2]:
                    objects[match[1]] = match[2]
            elif line.startswith("calls="):
                called = True  # the next line is the cost of the callee
            elif match := re.match(r"[+\-*\d]\S* (\d+)$", line):
                if ours and not called:
                    total += int(match[1])
                called = False
        return total


def loading(libraries):
    """The number of instructions that a program executes to load the libraries."""
    with tempfile.TemporaryDirectory() as folder:
        profile = pathlib.Path(folder, "profile")
        subprocess.run(
            ["valgrind", "--tool=callgrind", f"--callgrind-out-file={profile}", "/bin/true"],
            env=os.environ | {"LD_PRELOAD": ":".join(map(str, libraries))},
            check=True, stderr=subprocess.DEVNULL)
        return int(re.search(r"^totals: (\d+)$", profile.read_text(), re.MULTILINE)[1])


def text_size(library):
    """The size of the library's instructions and constants in bytes."""
    output = subprocess.run(["size", library], check=True, stdout=subprocess.PIPE, text=True).stdout
    return int(output.splitlines()[1].split()[0])


def operations_of(program):
    """The operations that the program lists in its usage message."""
    usage = subprocess.run([program], stderr=subprocess.PIPE, text=True).stderr
    return [line.strip() for line in usage.splitlines() if line.startswith("  ")]


def read_table(path):
    table = {}
    compiler = None
    for line in path.read_text().splitlines():
        if line.startswith("compiler "):
            compiler = line.split(" ", 1)[1]
        elif line and not line.startswith("#"):
            operation, count = line.split()
            table[operation] = float(count)
    return compiler, table


def main():
    arguments = argparse.ArgumentParser(description=__doc__)
    arguments.add_argument("program")
    arguments.add_argument("compiler")
    arguments.add_argument("table", type=pathlib.Path)
    arguments.add_argument("--update", action="store_true")
    options = arguments.parse_args()

    compiler, table = read_table(options.table)
    if not table:
        sys.exit(f"{options.table} has no operations")
    if compiler != options.compiler and not options.update:
        sys.exit(f"{options.table} has the counts of {compiler}, and each compiler has its own; this is "
                 f"{options.compiler}. To compare a change here, first make a table without it, with --update")

    build = pathlib.Path(options.program).resolve().parents[1]
    library = build / "libIC.so"
    operations = [*operations_of(options.program), LOAD, SIZE]
    if set(operations) != set(table) and not options.update:
        sys.exit(f"{options.table} and the program differ in these operations: "
                 f"{', '.join(sorted(set(operations) ^ set(table)))}")

    def count(operation):
        if operation == LOAD:
            platform = [build / "platform/libZQ.so", build / "platform/libVXLog.so"]
            return loading([library, *platform]) - loading(["libstdc++.so.6"])
        if operation == SIZE:
            return text_size(library)
        first, second = (executed(options.program, operation, runs) for runs in RUNS)
        return (second - first) / (RUNS[1] - RUNS[0])

    operations.sort(key=[*table, *operations].index)  # the new ones last
    with concurrent.futures.ThreadPoolExecutor(os.cpu_count()) as executor:
        counts = dict(zip(operations, executor.map(count, operations)))

    exceeded = []
    print(f"{'operation':20} {'now':>9} {'table':>9} {'ratio':>6}")
    for operation, now in counts.items():
        before = table.get(operation, math.nan)
        ratio = now / before
        print(f"{operation:20} {now:9.1f} {before:9.1f} {ratio:6.3f}")
        if not 1 - TOLERANCE <= ratio <= 1 + TOLERANCE:
            exceeded.append(operation)

    if options.update:
        comments = [line for line in options.table.read_text().splitlines() if line.startswith("#")]
        lines = comments + [f"compiler {options.compiler}"]
        lines += [f"{operation} {count:.1f}" for operation, count in counts.items()]
        options.table.write_text("\n".join(lines) + "\n")
    elif exceeded:
        sys.exit(f"More than 3 % from the table: {', '.join(exceeded)}. "
                 "If that is intended, replace the table with --update")


if __name__ == "__main__":
    main()
