#!/usr/bin/env python3
"""Links the objects of the library and of a program in many orders and runs each program. Fails if the library's
objects are not constructed before the program's or not destroyed after them."""

import argparse
import pathlib
import random
import subprocess
import sys

CHECKS = ("first", "second", "third", "main")
EXPECTED = sorted(f"{name} {when}: right" for name in CHECKS for when in ("begins", "ends"))


def shuffled(objects, source):
    return source.sample(objects, len(objects))


def order(number, client, library):
    """In turn: the program's objects first, the library's objects first, all objects shuffled."""
    source = random.Random(number)
    client, library = shuffled(client, source), shuffled(library, source)
    return [client + library, library + client, shuffled(client + library, source)][number % 3]


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("--folder", type=pathlib.Path, required=True)
    parser.add_argument("--orders", type=int, required=True)
    parser.add_argument("--client", nargs="+", required=True)
    parser.add_argument("--delivered", nargs="+", required=True)
    parser.add_argument("--compiler", nargs=argparse.REMAINDER, required=True)
    arguments = parser.parse_args()

    arguments.folder.mkdir(parents=True, exist_ok=True)
    program = arguments.folder / "program"
    for number in range(arguments.orders):
        objects = order(number, arguments.client, arguments.delivered)
        subprocess.run([*arguments.compiler, *objects, "-o", program, "-pthread"], check=True)
        run = subprocess.run([program], stdout=subprocess.PIPE, text=True, check=False)
        if run.returncode != 0 or sorted(run.stdout.splitlines()) != EXPECTED:
            names = "\n  ".join(pathlib.Path(name).name for name in objects)
            sys.exit(f"Order {number} ended with {run.returncode} and printed\n{run.stdout}\nlinked as\n  {names}")


main()
