"""Changes the library for the worse in one place at a time and runs the tests of the classes: they have to fail.

    mutants.py branches    each conditional branch of the compiled library is taken always, and never
    mutants.py rules       the wrong rules of rules.txt, one after another

Prints the mutants by file, and each one that no test noticed. harmless.txt names the branches that need not be
noticed and says why. Exits with 1 where anything is left over, in either direction.
"""

import collections
import concurrent.futures
import json
import os
import pathlib
import re
import resource
import shlex
import shutil
import subprocess
import sys
import tempfile
import time

HERE = pathlib.Path(__file__).resolve().parent
ROOT = HERE.parent.parent
BUILD = ROOT / "build" / "mutants"
JOBS = os.cpu_count()
MEMORY = 1 << 29  # bytes that a test program may use; more counts as a failure

# Every inline function of the public headers, so that there is something to change and to link first.
HEADERS = "include/IC"

# Assembly in which a condition of the source is a jump, also in a switch, and in which little else is one.
JUMPING = ["-S", "-g1", "-O1", "-fno-inline", "-fno-jump-tables", "-fno-bit-tests", "-fno-if-conversion",
           "-fno-if-conversion2", "-fno-tree-loop-if-convert", "-fno-ssa-phiopt"]  # fmt: skip

Mutant = collections.namedtuple("Mutant", "file name objects")


def fail(message):
    sys.exit(f"mutants: {message}")


def output_of(command, **options):
    done = subprocess.run(command, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True, **options)
    if done.returncode != 0:
        fail(f"{shlex.join(map(str, command))}\n{done.stdout}")
    return done.stdout


class Program:
    """A test program: how it is linked, and what it needed when nothing was wrong."""

    def __init__(self, path):
        self.name = pathlib.Path(path).name
        # ": && compiler objects -o tests/X libraries && what is done with the program"
        line = output_of(["ninja", "-C", BUILD, "-t", "commands", path]).splitlines()[-1]
        words = shlex.split(line.split(" && ")[1])
        at = words.index("-o")
        # What is linked first provides the inline functions to all.
        self.start = [words[0]]
        self.rest = [*words[1:at], *words[at + 2 :], "-fuse-ld=lld", "-Wl,--threads=1"]
        self.seconds = None

    def link(self, objects, place):
        program = place / self.name
        output_of([*self.start, *objects, *self.rest, "-o", program], cwd=BUILD)
        return program

    def passes(self, objects, place):
        program = self.link(objects, place)
        # Generous: where time decides, the program is in a loop, or waits for ever.
        seconds = 60 if self.seconds is None else 2 + int(5 * self.seconds)

        def limit():
            resource.setrlimit(resource.RLIMIT_AS, (MEMORY, MEMORY))
            resource.setrlimit(resource.RLIMIT_CPU, (seconds, seconds))
            resource.setrlimit(resource.RLIMIT_CORE, (0, 0))

        before = resource.getrusage(resource.RUSAGE_CHILDREN)
        try:
            status = subprocess.run(
                [program, "--gtest_fail_fast", "--gtest_brief=1"],
                stdin=subprocess.DEVNULL,
                stdout=subprocess.DEVNULL,
                stderr=subprocess.DEVNULL,
                preexec_fn=limit,
                timeout=20 * seconds,
            ).returncode
        except subprocess.TimeoutExpired:
            status = None
        finally:
            program.unlink()
        if self.seconds is None:
            after = resource.getrusage(resource.RUSAGE_CHILDREN)
            self.seconds = after.ru_utime - before.ru_utime
        return status == 0


class Suite:
    """The library as the class tests see it, and these tests."""

    def __init__(self):
        print("Building the tests", file=sys.stderr)
        output_of(
            ["cmake", "-S", ROOT, "-B", BUILD, "-G", "Ninja", "-DCMAKE_BUILD_TYPE=", "-DCMAKE_CXX_COMPILER=g++",
             "-DCMAKE_CXX_STANDARD=17", "-DBUILD_SHARED_LIBS=OFF", "-DCMAKE_EXPORT_COMPILE_COMMANDS=ON"]
        )  # fmt: skip
        library = "testkit/libICTesting.a"
        users = output_of(["ninja", "-C", BUILD, "-t", "query", library]).partition("outputs:")[2].split()
        paths = [user for user in users if re.fullmatch(r"tests/classes/\w+_test", user)]
        if not paths:
            fail("no test program links " + library)
        output_of(["cmake", "--build", BUILD, "--target", *(pathlib.Path(path).name for path in paths)])
        self.programs = [Program(path) for path in paths]
        self.commands = {}
        for entry in json.loads((BUILD / "compile_commands.json").read_text()):
            words = shlex.split(entry["command"])
            file = str(pathlib.Path(entry["file"]).relative_to(ROOT))
            if file.startswith("src/") and "ICTesting.dir/" in words[words.index("-o") + 1]:
                self.commands[file] = words[: words.index("-o")]
        self.place = pathlib.Path(tempfile.mkdtemp(dir=BUILD))

    def compile(self, file, output, tree=ROOT, options=("-c", "-O0")):
        """Compiles a source of the library, or HEADERS, as it stands in `tree`."""
        words = [word.replace(f"{ROOT}/include", f"{tree}/include").replace(f"{ROOT}/src", f"{tree}/src")
                 for word in self.commands[file if file != HEADERS else "src/Alert.cpp"]]  # fmt: skip
        source = tree / file
        if file == HEADERS:
            source = output.with_suffix(".cpp")
            # The two for formatting have templates alone, and the functions of what they include.
            names = sorted({header.name for header in (ROOT / HEADERS).glob("*.h")} - {"fmt.h", "format.h"})
            source.write_text("".join(f'#include "IC/{name}"\n' for name in names))
            options = [*options, "-fkeep-inline-functions"]
        output_of([*words, *options, "-w", "-o", output, source], cwd=BUILD)

    def likeliest_first(self, file):
        stem = pathlib.Path(file).stem
        return sorted(self.programs, key=lambda program: (not program.name.startswith(stem), program.seconds))

    def check(self, objects):
        """The unchanged library has to pass."""
        for program in self.programs:
            if not program.passes(objects, self.place):
                fail(f"{program.name} fails with the unchanged library")

    def notices(self, mutant):
        """Whether a test fails."""
        place = pathlib.Path(tempfile.mkdtemp(dir=self.place))
        try:
            objects = mutant.objects(place)
            return not all(program.passes(objects, place) for program in self.likeliest_first(mutant.file))
        finally:
            shutil.rmtree(place)

    def unnoticed(self, mutants):
        """Prints a table by file, and returns the mutants that no test noticed."""
        started = time.monotonic()
        noticed = []
        with concurrent.futures.ThreadPoolExecutor(JOBS) as pool:
            try:
                for result in pool.map(self.notices, mutants):
                    noticed.append(result)
                    if len(noticed) % 100 == 0:
                        print(f"{len(noticed)} of {len(mutants)}", file=sys.stderr)
            except BaseException:  # also fail(), for one that does not compile
                pool.shutdown(cancel_futures=True)
                raise
        print(f"{'':24}{'mutants':>10}{'noticed':>10}")
        for file in sorted({mutant.file for mutant in mutants}):
            results = [result for mutant, result in zip(mutants, noticed) if mutant.file == file]
            print(f"{file:24}{len(results):10}{sum(results):10}")
        print(f"{'total':24}{len(mutants):10}{sum(noticed):10}  in {time.monotonic() - started:.0f} s")
        return [mutant for mutant, result in zip(mutants, noticed) if not result]


# Branches


def assemble(lines, place, name):
    object_file = place / f"{name}.o"
    output_of(["as", "--64", "-o", object_file, "-"], input="\n".join(lines))
    return object_file


def branches(suite):
    """A mutant for each direction of each conditional jump in a function of the library's own."""
    mutants = []
    originals = []
    seen = set()
    for file in [*suite.commands, HEADERS]:
        assembly = suite.place / (file.replace("/", "_") + ".s")
        suite.compile(file, assembly, options=JUMPING)
        lines = assembly.read_text().splitlines()
        originals.append(assemble(lines, suite.place, assembly.stem))
        jumps = jumps_of(lines, seen)
        names = demangled({function for function, _, _ in jumps})
        total = collections.Counter((function, text) for function, text, _ in jumps)
        count = collections.Counter()
        for function, text, at in jumps:
            count[function, text] += 1
            which = f"{count[function, text]} of {total[function, text]}"
            for direction in ("always", "never"):
                mutants.append(
                    Mutant(file, (names[function], text, f"{which} {direction}"), turned(lines, at, direction))
                )
        seen |= {function for function, _, _ in jumps}
    suite.check(originals)
    return mutants


def jumps_of(lines, seen):
    """(function, text of the source's line, number of the assembly's line), in order."""
    files = {}
    function = text = None
    jumps = []
    for at, line in enumerate(lines):
        if label := re.match(r"(\w+):", line):
            function = label[1]
        elif named := re.match(r'\t\.file\s(\d+) "([^"]*)"(?: "([^"]*)")?', line):
            files[named[1]] = pathlib.Path(named[2], named[3] or "")
        elif located := re.match(r"\t\.loc\s(\d+) (\d+)", line):
            text = (files[located[1]], int(located[2]))
        elif re.match(r"\tj(?!mp)\w+\t", line) and re.match(r"_ZZ*NK?(2IC|7IC_NODE)", function):
            if function not in seen:
                jumps.append((function, source_line(*text), at))
    return jumps


def source_line(file, number, cache={}):
    if file not in cache:
        cache[file] = file.read_text().splitlines()
    return cache[file][number - 1].strip()


def turned(lines, at, direction):
    def objects(place):
        target = lines[at].split()[1]
        jump = f"\tjmp\t{target}" if direction == "always" else ""
        return [assemble([*lines[:at], jump, *lines[at + 1 :]], place, "mutant")]

    return objects


def demangled(functions):
    functions = sorted(functions)
    names = output_of(["c++filt"], input="\n".join(functions)).splitlines()
    return dict(zip(functions, names))


def harmless():
    """{(function, line, branch): reason}"""
    reasons = {}
    for block in re.split(r"\n\s*\n", (HERE / "harmless.txt").read_text()):
        fields = dict(line.split(": ", 1) for line in block.splitlines() if line and not line.startswith("#"))
        if fields:
            reasons[fields["function"], fields["line"], fields["branch"]] = fields["why"]
    return reasons


def run_branches(suite):
    mutants = branches(suite)
    unnoticed = {mutant.name: mutant for mutant in suite.unnoticed(mutants)}
    reasons = harmless()
    status = 0
    for name, mutant in unnoticed.items():
        if name in reasons:
            continue
        function, text, branch = name
        print(f"\nNo test noticed, in {mutant.file}:\nfunction: {function}\nline: {text}\nbranch: {branch}")
        status = 1
    for function, text, branch in reasons.keys() - unnoticed.keys():
        print(f"\nharmless.txt names what is not there or was noticed:\nfunction: {function}\nline: {text}\nbranch: {branch}")
        status = 1
    print(f"harmless: {len(reasons.keys() & unnoticed.keys())}, see tests/mutants/harmless.txt")
    return status


# Rules


def rules():
    """(file, name, old, new) of each block of rules.txt."""
    for block in re.split(r"\n\s*\n", (HERE / "rules.txt").read_text()):
        lines = [line for line in block.splitlines() if line and not line.startswith("#")]
        if not lines:
            continue
        file, _, name = lines[0].partition(": ")
        old = "\n".join(line[1:] for line in lines if line.startswith("-"))
        new = "\n".join(line[1:] for line in lines if line.startswith("+"))
        if not name or not old or old == new or not (ROOT / file).is_file():
            fail(f"rules.txt: not a rule: {lines[0]}")
        if (count := (ROOT / file).read_text().count(old)) != 1:
            fail(f"rules.txt: {lines[0]}: stands there {count} times")
        yield file, name, old, new


def compiled_with(suite, file):
    """What is compiled anew when this file changes: a header's inline functions, and the sources it decides."""
    if file in suite.commands:
        return [file]
    header = pathlib.Path(file)
    if str(header.parent) == HEADERS:
        return [HEADERS, f"src/{header.stem}.cpp"]
    return [source for source in suite.commands if header.name in (ROOT / source).read_text()]


def broken(suite, file, old, new):
    def objects(place):
        tree = place / "tree"
        for folder in ("include", "src"):
            shutil.copytree(ROOT / folder, tree / folder)
        changed = tree / file
        changed.write_text(changed.read_text().replace(old, new))
        return compile_all(suite, compiled_with(suite, file), tree, place)

    return objects


def compile_all(suite, files, tree, place):
    objects = []
    for file in files:
        objects.append(place / (file.replace("/", "_") + ".o"))
        suite.compile(file, objects[-1], tree)
    return objects


def run_rules(suite):
    mutants = [Mutant(file, name, broken(suite, file, old, new)) for file, name, old, new in rules()]
    suite.check(compile_all(suite, [HEADERS, *suite.commands], ROOT, suite.place))
    unnoticed = suite.unnoticed(mutants)
    for mutant in unnoticed:
        print(f"No test noticed: {mutant.file}: {mutant.name}")
    return 1 if unnoticed else 0


def main():
    parts = {"branches": run_branches, "rules": run_rules}
    if len(sys.argv) != 2 or sys.argv[1] not in parts:
        sys.exit("usage: scripts/checks/mutants branches | rules")
    suite = Suite()
    try:
        status = parts[sys.argv[1]](suite)
    finally:
        shutil.rmtree(suite.place)
    sys.exit(status)


main()
