"""Compares docs/refusals.md with what the tests saw: refusals.py PAGE PROGRAM...

Each test program reports what it expected to be refused. Every one of these has to stand in the page, and every row
of the page has to have been seen.
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
    """(file, function, record, exception) of each row, the last two as patterns."""
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
    text = re.sub(r"\d+", "#", text)  # as the tests report it
    return re.sub(r"<[a-z]+>", "[-+.e#]+|-?inf", re.escape(text)).replace("[-+.e#]+|-?inf", "(?:[-+.e#]+|-?inf)")


def seen(program):
    """The same of each refusal that a test expected."""
    with tempfile.TemporaryDirectory() as folder:
        report = pathlib.Path(folder) / "report.xml"
        subprocess.run([program, "--gtest_brief=1", f"--gtest_output=xml:{report}"], check=True,
                       stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)  # fmt: skip
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
        print("Seen by a test, but not in the page:", *refusal, sep="\n    ")
    for row in sorted(unseen):
        print("In the page, but seen by no test:", *row, sep="\n    ")
    if not refusals or unlisted or unseen:
        sys.exit(1)
    print(f"{len(expected)} refusals")


main()
