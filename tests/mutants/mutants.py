"""Changes the library in one place at a time and runs the tests of the classes, of which one must fail.

    mutants.py branches    takes each conditional branch of the compiled library always, and never
    mutants.py rules       makes the changes of rules.txt

Prints how many mutants each file has and how many a test noticed, then each mutant that no test noticed. Exits with 1
if there is one that harmless.txt does not name, and if harmless.txt or rules.txt is stale.
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

from quotes import ROOT, code, harmless, rules

BUILD = ROOT / "build" / "mutants"
JOBS = os.cpu_count()
MEMORY = 1 << 29  # bytes that a test program may use; more counts as a failure

# Stands for one source that includes the public headers; its object file has all their inline functions.
HEADERS = "include/IC"

# Compiles each condition of the source to jumps, also those of a switch, and little else. Names the files relative to
# TREE: the compiler writes letters of a path other than ASCII as escape sequences.
TREE = pathlib.Path("/tree")
JUMPING = [f"-ffile-prefix-map={ROOT}={TREE}", "-S", "-g1", "-O1", "-fno-inline", "-fno-jump-tables",
           "-fno-bit-tests", "-fno-if-conversion", "-fno-if-conversion2", "-fno-tree-loop-if-convert",
           "-fno-ssa-phiopt"]  # fmt: skip

Mutant = collections.namedtuple("Mutant", "file name objects")
Branch = collections.namedtuple("Branch", "function source statement turned")


def fail(message):
    sys.exit(f"mutants: {message}")


def output_of(command, **options):
    done = subprocess.run(command, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True, **options)
    if done.returncode != 0:
        fail(f"{shlex.join(map(str, command))}\n{done.stdout}")
    return done.stdout


class Program:
    """A test program: how it is linked, and how long it takes with the unchanged library."""

    def __init__(self, path):
        self.name = pathlib.Path(path).name
        # ": && compiler objects -o tests/X libraries && further commands"
        line = output_of(["ninja", "-C", BUILD, "-t", "commands", path]).splitlines()[-1]
        words = shlex.split(line.split(" && ")[1])
        at = words.index("-o")
        # The object linked first provides the inline functions to all others.
        self.start = [words[0]]
        self.rest = [*words[1:at], *words[at + 2 :], "-fuse-ld=lld", "-Wl,--threads=1"]
        self.seconds = None

    def link(self, objects, place):
        program = place / self.name
        output_of([*self.start, *objects, *self.rest, "-o", program], cwd=BUILD)
        return program

    def passes(self, objects, place):
        program = self.link(objects, place)
        # Generous, so that only an endless loop or wait exceeds it.
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
    """The library as the tests of the classes link it, and these tests."""

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
        """Compiles a source of the library, or HEADERS, from the folder `tree`."""
        words = [word.replace(f"{ROOT}/include", f"{tree}/include").replace(f"{ROOT}/src", f"{tree}/src")
                 for word in self.commands[file if file != HEADERS else "src/Alert.cpp"]]  # fmt: skip
        source = tree / file
        if file == HEADERS:
            source = output.with_suffix(".cpp")
            # Optional: only programs that use another library compile these.
            optional = {"fmt.h", "format.h", "json.h"}
            names = sorted({header.name for header in (ROOT / HEADERS).glob("*.h")} - optional)
            source.write_text("".join(f'#include "IC/{name}"\n' for name in names))
            options = [*options, "-fkeep-inline-functions"]
        output_of([*words, *options, "-w", "-o", output, source], cwd=BUILD)

    def likeliest_first(self, file):
        stem = pathlib.Path(file).stem.replace("-inl", "")
        return sorted(self.programs, key=lambda program: (not program.name.startswith(stem), program.seconds))

    def check(self, objects):
        """Exits unless all tests pass with the unchanged library."""
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
            except BaseException:  # also SystemExit, of fail(), if a mutant does not compile
                pool.shutdown(cancel_futures=True)
                raise
        print(f"{'':34}{'mutants':>10}{'noticed':>10}")
        for file in sorted({mutant.file for mutant in mutants}):
            results = [result for mutant, result in zip(mutants, noticed) if mutant.file == file]
            print(f"{file:34}{len(results):10}{sum(results):10}")
        print(f"{'total':34}{len(mutants):10}{sum(noticed):10}  in {time.monotonic() - started:.0f} s")
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
        for (function, source, statement), numbers in jumps.items():
            for which, number in enumerate(numbers, 1):
                for direction in ("always", "never"):
                    turned = f"{which} of {len(numbers)} {direction}"
                    branch = Branch(names[function], source, statement, turned)
                    mutants.append(Mutant(file, branch, with_jump(lines, number, direction)))
        seen |= {function for function, _, _ in jumps}
    suite.check(originals)
    return mutants


def jumps_of(lines, seen):
    """{(function, source, statement): numbers of the assembly's lines}"""
    files = {}
    function = place = None
    jumps = collections.defaultdict(list)
    for number, line in enumerate(lines):
        if label := re.match(r"(\w+):", line):
            function = label[1]
        elif named := re.match(r'\t\.file\s(\d+) "([^"]*)"(?: "([^"]*)")?', line):
            files[named[1]] = pathlib.Path(named[2], named[3] or "")
        elif located := re.match(r"\t\.loc\s(\d+) (\d+) (\d+)", line):
            place = located.groups()
        elif re.match(r"\tj(?!mp)\w+\t", line) and re.match(r"_ZZ*NK?(2IC|7IC_NODE)", function):
            if function not in seen:
                source = str(files[place[0]].relative_to(TREE))
                here = code(source)
                statement = here.statement(here.at(int(place[1]), int(place[2])))
                jumps[function, source, statement].append(number)
    return jumps


def with_jump(lines, number, direction):
    def objects(place):
        target = lines[number].split()[1]
        jump = f"\tjmp\t{target}" if direction == "always" else ""
        return [assemble([*lines[:number], jump, *lines[number + 1 :]], place, "mutant")]

    return objects


def demangled(functions):
    functions = sorted(functions)
    names = output_of(["c++filt"], input="\n".join(functions)).splitlines()
    return dict(zip(functions, names))


def means(entry, branch):
    """Whether an entry of harmless.txt is about this branch."""
    quoted = (entry["file"], entry["quoted"], entry["branch"])
    return quoted == (branch.source, branch.statement, branch.turned) and any(
        part in branch.function for part in entry.get("for", "").split(", ")
    )


def run_branches(suite):
    known = harmless()
    mutants = branches(suite)
    unnoticed = [mutant.name for mutant in suite.unnoticed(mutants)]
    status = 0
    stated = [branch for branch in unnoticed if any(means(entry, branch) for entry in known)]
    for branch in unnoticed:
        if branch not in stated:
            print(f"\nNo test noticed, in {branch.function}:\nin: {branch.source}: ")
            print(f"statement: {code(branch.source).quote(branch.statement)}\nbranch: {branch.turned}\nwhy: ")
            status = 1
    for entry in known:
        meant = [mutant.name for mutant in mutants if means(entry, mutant.name)]
        if not meant or not set(meant) <= set(unnoticed):
            print("\nharmless.txt names what a test noticed, or no branch:")
            print("".join(f"{key}: {entry[key]}\n" for key in ("in", "statement", "branch")), end="")
            status = 1
    print(f"harmless: {len(stated)}, see tests/mutants/harmless.txt")
    return status


# Rules


def compiled_with(suite, file):
    """The sources to compile again when this file changes."""
    if file in suite.commands:
        return [file]
    header = pathlib.Path(file)
    if file.startswith(HEADERS):
        # Its constants also stand compiled in the source of the same name.
        return [HEADERS, *(source for source in suite.commands if source == f"src/{header.stem}.cpp")]
    users = [source for source in suite.commands if f"detail/{header.name}" in (ROOT / source).read_text()]
    for other in (ROOT / "src/detail").glob("*.h"):
        if f"detail/{header.name}" in other.read_text():
            users += compiled_with(suite, str(other.relative_to(ROOT)))
    return sorted(set(users))


def broken(suite, rule):
    def objects(place):
        tree = place / "tree"
        for folder in ("include", "src"):
            shutil.copytree(ROOT / folder, tree / folder)
        (tree / rule["file"]).write_text(code(rule["file"]).replaced(rule["quoted"], rule["new"]))
        return compile_all(suite, compiled_with(suite, rule["file"]), tree, place)

    return objects


def compile_all(suite, files, tree, place):
    objects = []
    for file in files:
        objects.append(place / (file.replace("/", "_") + ".o"))
        suite.compile(file, objects[-1], tree)
    return objects


def run_rules(suite):
    mutants = [Mutant(rule["file"], rule["rule"], broken(suite, rule)) for rule in rules()]
    suite.check(compile_all(suite, [HEADERS, *suite.commands], ROOT, suite.place))
    unnoticed = suite.unnoticed(mutants)
    for mutant in unnoticed:
        print(f"No test noticed: {mutant.file}: {mutant.name}")
    return 1 if unnoticed else 0


def main():
    parts = {"branches": run_branches, "rules": run_rules}
    if len(sys.argv) != 2 or sys.argv[1] not in parts:
        sys.exit("usage: scripts/checks/mutants [branches|rules|--check]")
    suite = Suite()
    try:
        status = parts[sys.argv[1]](suite)
    finally:
        shutil.rmtree(suite.place)
    sys.exit(status)


main()
