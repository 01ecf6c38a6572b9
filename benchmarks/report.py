#!/usr/bin/python3
"""Prints the results of the benchmark as a table and draws them.

The table has a row for each workload: the medians of this library, of the limit and of the peers, and the ratios of
the library to the limit and to the best peer, each with its bar. Exits with 1 if a bar is missed.
"""

import argparse
import dataclasses
import fnmatch
import html
import json
import math
import pathlib
import platform
import statistics
import sys

LIBRARY = "IC"
LIMIT = "limit"
RECORDS = "std::variant + records"
PEERS = ["std::variant", RECORDS, "nlohmann::json", "boost::json", "Poco::Var", "QVariant", "GVariant"]
SHARING = {"QVariant", "GVariant"}  # a copy is a further reference to the same content
COLUMNS = [LIBRARY, LIMIT] + PEERS
PRIMITIVE = "primitive"
ONE_THREAD = ", one thread"  # what a contender of a row of two threads does in one
NODE_PANELS = {"node", "two-threads", "nodes"}
WITHOUT_PEERS = {"bytes", "visit", "compile", "link", "load"}

BEGIN = "<!-- measured: begin (written by scripts/run-benchmarks --update-docs) -->"
END = "<!-- measured: end -->"


@dataclasses.dataclass
class Bar:
    """The highest ratios that the matching rows may have; None means no bar."""

    pattern: str
    limit: float | None
    peer: float | None
    peer_name: str | None


@dataclasses.dataclass
class Ratio:
    value: float
    bar: float | None
    other: str

    @property
    def missed(self):
        # Rounded to two digits, like the printed ratio and the bars.
        return self.bar is not None and round(self.value, 2) > self.bar

    def __str__(self):
        if self.bar is None:
            return f"{self.value:.2f}"
        return f"{self.value:.2f} {'> ' if self.missed else '≤ '}{self.bar:g}{' MISSED' if self.missed else ''}"


def kind(row):
    return row.split("/")[0]


def read_bars(path):
    bars = []
    for line in path.read_text(encoding="utf-8").splitlines():
        fields = line.split(maxsplit=3)
        if not fields or fields[0].startswith("#"):
            continue
        numbers = [None if field == "-" else float(field) for field in fields[1:3]]
        bars.append(Bar(fields[0], numbers[0], numbers[1], fields[3] if len(fields) > 3 else None))
    return bars


def read_process(path):
    """The context of one process, and for each of its rows the median of each contender, in nanoseconds or bytes."""
    file = json.loads(path.read_text(encoding="utf-8"))
    samples = {}
    for run in file["benchmarks"]:
        if run.get("run_type") != "iteration":
            continue
        if run.get("error_occurred"):
            sys.exit(f"{run['name']}: {run['error_message']}")
        row, contender = run["name"].split("|")
        contender = contender.split("/")[0]  # without the runner's suffix, such as the number of threads
        if row.startswith("two-threads/") and run["threads"] == 1:
            contender += ONE_THREAD
        if "bytes" in run:
            sample = run["bytes"]
        elif row.startswith("two-threads/"):
            # Real time, since threads also wait.
            sample = 1e9 / run["items_per_second"]
        else:
            # CPU time, which other processes disturb least.
            sample = run["cpu_time"]
        samples.setdefault(row, {}).setdefault(contender, []).append(sample)
    return file["context"], {
        row: {contender: statistics.median(values) for contender, values in contenders.items()}
        for row, contenders in samples.items()
    }


def read_commands(paths):
    """One round of hyperfine: for each row the CPU time of each contender, in nanoseconds."""
    rows = {}
    for path in paths:
        for result in json.loads(path.read_text(encoding="utf-8"))["results"]:
            row, contender = result["command"].split("|")
            rows.setdefault(row, {})[contender] = 1e9 * (result["user"] + result["system"])
    shared = {row: rows.pop(row) for row in list(rows) if row.endswith("/*")}
    for pattern, contenders in shared.items():
        for row in fnmatch.filter(rows, pattern):
            rows[row].update(contenders)
    return rows


class Row(dict):
    """The median of each contender over all processes, and the results of each process."""

    def __init__(self, processes):
        self.processes = processes
        super().__init__(
            (contender, statistics.median(process[contender] for process in processes)) for contender in processes[0]
        )

    def ratio(self, contender, other):
        """The median of the ratios within the processes: a slow phase of the machine slows both contenders."""
        return statistics.median(process[contender] / process[other] for process in self.processes)


def read_results(paths):
    """The context, and the rows by their names."""
    processes = {}
    rounds = {}
    for path in paths:
        if path.name.startswith("start-"):
            rounds.setdefault(path.name.split("-")[1], []).append(path)
            continue
        context, rows = read_process(path)
        for row, contenders in rows.items():
            processes.setdefault(row, []).append(contenders)
    for commands in rounds.values():
        for row, contenders in read_commands(commands).items():
            processes.setdefault(row, []).append(contenders)
    kinds = list(dict.fromkeys(kind(row) for row in processes))
    # Rows of one kind stand together; sizes and primitives come last.
    rows = sorted(processes, key=lambda row: (kind(row) in {"bytes", PRIMITIVE}, kinds.index(kind(row))))
    return context, {row: Row(processes[row]) for row in rows}


def bar_of(row, bars):
    for bar in bars:
        if fnmatch.fnmatchcase(row, bar.pattern):
            return bar
    return Bar(row, None, None, None)


def ratios(row, medians, bars):
    """The ratios of the library to the limit and to the peer; None for what was not measured.

    If a row has a bar against something that was not measured, the report ends with an error.
    """
    if LIBRARY not in medians:
        return None, None
    bar = bar_of(row, bars)
    if bar.limit is not None and LIMIT not in medians:
        sys.exit(f"{row}: has a bar against the limit, which was not measured")
    against_limit = Ratio(medians.ratio(LIBRARY, LIMIT), bar.limit, LIMIT) if LIMIT in medians else None
    candidates = [bar.peer_name] if bar.peer_name else [
        peer for peer in PEERS if peer not in SHARING and peer != RECORDS]
    candidates = [peer for peer in candidates if peer in medians]
    if not candidates and bar.peer is not None:
        sys.exit(f"{row}: has a bar against a peer, but none was measured")
    if not candidates:
        return against_limit, None
    best = min(candidates, key=medians.get)
    return against_limit, Ratio(medians.ratio(LIBRARY, best), bar.peer, best)


def quantity(value, row):
    if row.startswith("bytes/"):
        return f"{value:.0f} B"
    for unit, size in (("ms", 1e6), ("µs", 1e3)):
        if value >= size:
            value /= size
            break
    else:
        unit = "ns"
    return f"{value:.{max(0, 2 - int(math.log10(max(value, 1))))}f} {unit}"


def heading(contender):
    return contender + (" *" if contender in SHARING else "")


def table(results, bars, columns):
    """The table in Markdown, with aligned columns."""
    lines = [["workload"] + [heading(column) for column in columns] + ["÷ limit", "÷ best peer", "best peer"]]
    for row, medians in results.items():
        if PRIMITIVE in medians:
            continue
        against_limit, against_peer = ratios(row, medians, bars)
        lines.append(
            [row]
            + [quantity(medians[column], row) if column in medians else "" for column in columns]
            + [str(ratio) if ratio else "" for ratio in (against_limit, against_peer)]
            + [against_peer.other if against_peer else ""]
        )
    widths = [max(len(line[i]) for line in lines) for i in range(len(lines[0]))]
    lines.insert(1, ["-" * widths[0]] + ["-" * (width - 1) + ":" for width in widths[1:-1]] + ["-" * widths[-1]])
    return "\n".join(
        "| " + " | ".join(cell.rjust(width) if 0 < i < len(line) - 1 else cell.ljust(width)
                          for i, (cell, width) in enumerate(zip(line, widths))) + " |"
        for line in lines
    )


def lacking(results, columns):
    """One line for each peer, with the workloads that it does not offer."""
    rows = [row for row in results if LIBRARY in results[row] and kind(row) not in NODE_PANELS | WITHOUT_PEERS]
    lines = []
    for column in columns:
        missing = {row for row in rows if column not in results[row]}
        if column == RECORDS or not missing:
            continue
        for pattern in dict.fromkeys(
            [kind(row) + "/*" for row in rows] + ["*/" + row.split("/", 1)[1] for row in rows]
        ):
            covered = {row for row in rows if fnmatch.fnmatchcase(row, pattern)}
            if len(covered) > 1 and not any(column in results[row] for row in covered):
                missing = {row for row in missing if row not in covered} | {pattern}
        lines.append(f"- {column} has no {', '.join(sorted(missing))}.")
    return lines


def throughputs(results):
    """For each row of two threads, how many times the work of one thread each contender does in two."""
    lines = []
    for row, medians in results.items():
        factors = [
            f"{contender} {medians.ratio(contender + ONE_THREAD, contender):.2f}"
            for contender in COLUMNS
            if contender + ONE_THREAD in medians
        ]
        if factors:
            lines.append(f"Two threads do so many times the work of one in {row}: {', '.join(factors)}.")
    return lines


def processor():
    for line in pathlib.Path("/proc/cpuinfo").read_text(encoding="utf-8").splitlines():
        if line.startswith("model name"):
            return line.split(":", 1)[1].strip()
    return platform.machine()


def operating_system():
    try:
        return platform.freedesktop_os_release()["PRETTY_NAME"]
    except OSError:
        return platform.system()


def report(context, results, bars):
    """The lines of the report in Markdown, and the number of missed bars."""
    columns = [column for column in COLUMNS if any(column in medians for medians in results.values())]
    judged = [
        (row, ratio)
        for row, medians in results.items()
        for ratio in ratios(row, medians, bars)
        if ratio and ratio.bar is not None
    ]
    missed = [(row, ratio) for row, ratio in judged if ratio.missed]
    for bar in bars:
        if not any(fnmatch.fnmatchcase(row, bar.pattern) for row in results):
            sys.exit(f"There is a bar for {bar.pattern}, but no row matches")
    lines = [
        f"- {processor()}, {context['num_cpus']} processors, {operating_system()}, {context['compiler']}; "
        f"{context['date'][:10]}.",
        f"- Peers: {context['peers']}.",
    ]
    if context["missing peers"]:
        lines.append(f"- Not found on this machine, and left out: {context['missing peers'].rstrip('; ')}.")
    lines += lacking(results, columns)
    lines += [
        "",
        table(results, bars, columns),
        "",
        "\\* A copy shares its content with its source; the ratios do not count this peer.",
        "",
        *(line for throughput in throughputs(results) for line in (throughput, "")),
        "What the operations are made of: "
        + ", ".join(
            f"{row.split('/')[1]} {quantity(medians[PRIMITIVE], row)}"
            for row, medians in results.items()
            if PRIMITIVE in medians
        )
        + ".",
        "",
        f"{len(judged) - len(missed)} of {len(judged)} bars met.",
    ]
    lines += [f"- missed: {row} against {ratio.other}: {ratio.value:.2f} > {ratio.bar:g}" for row, ratio in missed]
    return lines, len(missed)


# The figure has a line for each of these workloads: what users do most, and where the library is first and last.

SHOWN = [
    "make/number", "copy/number", "copy/text12", "copy/texts100", "read/number", "equal/number", "equal/numbers100",
    "text/number", "text/real", "map32/find-and-read", "map32/print", "node/get-and-read", "node/set-number",
    "refused-read/text12", "compile/Node.h", "bytes/value/numbers100",
]
STYLE = """
text { font: 13px sans-serif; fill: #222; } .card { fill: #fff; }
.strong { font-weight: bold; } .middle { text-anchor: middle; } .end { text-anchor: end; }
line { stroke: #ddd; } .one { stroke: #222; } .stem { stroke-width: 3; }
.faster { fill: #0072b2; stroke: #0072b2; } .slower { fill: #c84a00; stroke: #c84a00; }
@media (prefers-color-scheme: dark) {
text { fill: #e2e2e2; } .card { fill: #1b1e23; } line { stroke: #3c4048; } .one { stroke: #e2e2e2; }
.faster { fill: #56b4e9; stroke: #56b4e9; } .slower { fill: #ff9248; stroke: #ff9248; }
}
"""


def draw(results, bars):
    """The figure as SVG: the ratio to the best peer and, where a bar names another peer, the ratio to that one."""
    shown = []
    for row in SHOWN:
        medians = results[row]
        counted = [peer for peer in PEERS if peer in medians and peer not in SHARING]
        faster = sum(round(medians.ratio(LIBRARY, peer), 2) > 1 for peer in counted)
        place = f"{1 + faster} of {1 + len(counted)}"
        against = [ratio for _, ratio in (ratios(row, medians, []), ratios(row, medians, bars)) if ratio]
        shown += [(value, row, peer, place) for peer, value in {ratio.other: ratio.value for ratio in against}.items()]
    shown.sort()
    low, high = (math.log(value) for value in (min(1, shown[0][0]) / 1.3, max(1, shown[-1][0]) * 1.3))

    def x(value):
        return round(180 + 240 * (math.log(value) - low) / (high - low), 1)

    def text(left, y, content, style=""):
        return f'<text x="{left}" y="{y}" class="{style}">{html.escape(content)}</text>'

    bottom = 98 + 21 * len(shown)
    parts = [
        f'<svg xmlns="http://www.w3.org/2000/svg" viewBox="0 0 700 {bottom + 30}" width="700" height="{bottom + 30}">',
        f"<style>{STYLE}</style>",
        '<rect width="100%" height="100%" rx="6" class="card"/>',
        text(14, 24, f"Time of {LIBRARY} ÷ time of the best peer whose copies are independent", "strong"),
        text(14, 43, f"The place is among {LIBRARY} and these peers. bytes/... compares memory, not time."),
        text(14, 62, "node/set-number is also compared with the node of variants that writes the same records."),
        text(14, 88, "workload", "strong"),
        text(x(1) - 8, 88, "← faster", "strong end"),
        text(x(1) + 8, 88, "slower →", "strong"),
        text(462, 88, "ratio", "strong end"),
        text(474, 88, "peer", "strong"),
        text(688, 88, "place", "strong end"),
    ]
    for tick in (0.01, 0.02, 0.05, 0.1, 0.2, 0.5, 1, 2, 5, 10, 20, 50, 100):
        if low < math.log(tick) < high:
            style = "one" if tick == 1 else ""
            parts.append(f'<line x1="{x(tick)}" y1="96" x2="{x(tick)}" y2="{bottom}" class="{style}"/>')
            parts.append(text(x(tick), bottom + 17, f"{tick:g}", "middle"))
    for y, (value, row, peer, place) in zip(range(108, bottom, 21), shown):
        side = "faster" if value < 1 else "slower"
        parts += [
            text(14, y + 4, row),
            f'<line x1="{x(1)}" y1="{y}" x2="{x(value)}" y2="{y}" class="stem {side}"/>',
            f'<circle cx="{x(value)}" cy="{y}" r="5" class="{side}"/>',
            text(462, y + 4, f"{value:.2f}", "end"), text(474, y + 4, peer), text(688, y + 4, place, "end"),
        ]
    return "\n".join(parts + ["</svg>", ""])


def update(page, lines):
    """Replaces the text between the two marks of the page."""
    text = page.read_text(encoding="utf-8")
    before, begin, rest = text.partition(BEGIN)
    _, end, after = rest.partition(END)
    if not begin or not end:
        sys.exit(f"{page}: the marks around the measured part are missing")
    measured = "\n".join(lines)
    page.write_text(f"{before}{BEGIN}\n\n{measured}\n\n{END}{after}", encoding="utf-8")


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("results", type=pathlib.Path, nargs="+",
                        help="the JSON files of the benchmark, and those of hyperfine, named start-*.json")
    parser.add_argument("--bars", type=pathlib.Path, default=pathlib.Path(__file__).with_name("bars.txt"))
    parser.add_argument("--svg", type=pathlib.Path, help="the file for the figure")
    parser.add_argument("--update", type=pathlib.Path, help="the page whose report is replaced")
    arguments = parser.parse_args()

    context, results = read_results(arguments.results)
    bars = read_bars(arguments.bars)
    lines, missed = report(context, results, bars)
    print("\n".join(lines))
    if arguments.svg:
        arguments.svg.write_text(draw(results, bars), encoding="utf-8")
    if arguments.update:
        update(arguments.update, lines)
    return 1 if missed else 0


if __name__ == "__main__":
    sys.exit(main())
