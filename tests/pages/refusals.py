"""Compares docs/refusals.md with the refusals that the tests expect: refusals.py PAGE PROGRAM...

Runs each test program, which reports the refusals that it expected. Fails if the page does not list one of them, or
lists one that no test expects.
"""

import pathlib
import re
import subprocess
import sys
import tempfile
import xml.etree.ElementTree

TYPES = {
    "St16invalid_argument": "std::invalid_argument",
    "St12out_of_range": "std::out_of_range",
    "N2IC24PropertyValueInvalidKindE": "IC::PropertyValueInvalidKind",
    "N2IC17NodeInvalidSensorE": "IC::NodeInvalidSensor",
}


def rows(page):
    """Yields (file, function, record, exception) for each row of the page, the last two as patterns."""
    file = None
    for line in page.read_text(encoding="utf-8").splitlines():
        if line.startswith("## "):
            file = line.removeprefix("## ")
        cells = [cell.strip() for cell in line.split("|")[1:-1]]
        if len(cells) == 5 and cells[0].startswith("`"):
            function, record, exception = (cell.replace("`", "") for cell in cells[:3])
            yield file, function, pattern(record), pattern(exception)


def pattern(text):
    if text == "none":
        return ""
    text = re.sub(r"\d+", "#", text)  # the tests report numbers as # too
    return re.sub(r"<[a-z]+>", "[-+.e#]+|-?inf", re.escape(text)).replace("[-+.e#]+|-?inf", "(?:[-+.e#]+|-?inf)")


def seen(program):
    """Yields the same, as texts, for each refusal that a test of the program expected."""
    with tempfile.TemporaryDirectory(dir=".") as folder:
        report = pathlib.Path(folder) / "report.xml"
        run = subprocess.run([program, "--gtest_brief=1", f"--gtest_output=xml:{report}"], text=True, errors="replace",
                             stdout=subprocess.PIPE, stderr=subprocess.STDOUT)  # fmt: skip
        if run.returncode != 0:
            sys.exit(f"{program} fails:\n{run.stdout}")
        for refusal in xml.etree.ElementTree.parse(report).iter("property"):
            file, function, level, record = refusal.get("name").split("|", 3)
            mangled, _, sentence = refusal.get("value").partition("|")
            exception = f"{TYPES[mangled]}: {sentence}" if mangled else ""
            yield file, function, record, re.sub(r"\d+", "#", exception)


def main():
    page = pathlib.Path(sys.argv[1])
    expected = list(rows(page))
    refusals = {refusal for program in sys.argv[2:] for refusal in seen(program)}
    unseen = set(expected)
    unlisted = []
    for file, function, record, exception in sorted(refusals):
        matching = {
            row for row in expected
            if row[:2] == (file, function) and re.fullmatch(row[2], record) and re.fullmatch(row[3], exception)
        }  # fmt: skip
        unseen -= matching
        if not matching:
            unlisted.append((file, function, record, exception))
    for refusal in unlisted:
        print("A test expects this refusal, but the page does not list it:", *refusal, sep="\n    ")
    for row in sorted(unseen):
        print("The page lists this refusal, but no test expects it:", *row, sep="\n    ")
    if not refusals:
        print("The tests have reported no refusal")
    if not refusals or unlisted or unseen:
        sys.exit(1)
    print(f"{len(expected)} refusals")


main()
