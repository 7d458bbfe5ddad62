#!/usr/bin/env python3
"""Makes one table of the passes of a benchmark, of both builds where there is a baseline, and of what building and
loading cost.

Of each number the smallest of all passes counts. script/bench calls this.
"""
import argparse
import datetime
import json
import os
import pathlib
import platform
import re
import subprocess
import tempfile

LEAST_GAIN = 0.97
REASONS = pathlib.Path(__file__).with_name("missed.md")
MISSED = " ✗"


def output_of(*command):
    return subprocess.run(command, check=True, capture_output=True, text=True).stdout


def found(build, name):
    """The one file of that name in a build folder."""
    return next(path for path in sorted(build.rglob(name)) if path.is_file())


def measured(build, passes):
    """The rows of all passes: the smallest of each number, by the row's name, in order."""
    rows = {}
    for number in range(1, passes + 1):
        for run in json.loads((build / f"pass-{number}.json").read_text())["benchmarks"]:
            name = run["name"].split("/iterations:")[0]
            row = rows.setdefault(name, {"floor": run.get("label", "")})
            for key, value in run.items():
                if isinstance(value, float) and key not in ("real_time", "cpu_time"):
                    row[key] = min(value, row.get(key, value))
    return rows


def compile_time(build, header, times):
    """The processor's seconds that a file takes which includes one header, at -O2."""
    commands = json.loads(found(build, "compile_commands.json").read_text())
    command = next(each["command"] for each in commands if each["file"].endswith("bench/Kit.cpp"))
    folders = re.findall(r"-I\S+", command)
    compiler = next(word for word in command.split() if re.search(r"(\+\+|cc)(-\d+)?$", word) and "ccache" not in word)
    with tempfile.TemporaryDirectory() as folder:
        source = pathlib.Path(folder, "header.cpp")
        source.write_text(f"#include <{header}>\n")
        seconds = []
        for _ in range(times):
            before = os.times()
            output_of(compiler, "-std=c++17", "-O2", *folders, "-c", source, "-o", f"{folder}/header.o")
            after = os.times()
            seconds.append(after.children_user - before.children_user)
        return min(seconds)


def costs_of(build, programs, times):
    """What building and loading cost: name, number, unit and the most that is allowed."""
    library = found(build, "liboxahvproviderutilities.so.1.*").resolve()
    relocations = sum(int(n) for n in re.findall(r"contains (\d+) entr", output_of("readelf", "-rW", library)))
    section = re.search(r"\.init_array\s+\S+\s+\S+\s+\S+\s+([0-9a-f]+)", output_of("readelf", "-SW", library))
    text = re.search(r"^(\d+)", output_of("size", library).splitlines()[1].strip())
    loader = found(programs, "oxahvbench-load")
    rows = [
        ("size: the library's code", int(text[1]) / 1024, " KiB", 100),
        ("load: relocations", relocations, "", None),
        # The C compiler's own start-up code has one entry.
        ("load: dynamic initialisers", int(section[1], 16) // 8 - 1, "", 3),
        ("load: dlopen", min(int(output_of(loader, library)) for _ in range(times)) / 1000, " µs", None),
    ]
    headers = [("Trace.h", 0.5), ("ProviderUtilities.h", None), ("ProviderKit.h", None)] if build == programs else []
    rows += [(f"compile: #include <{header}>", compile_time(build, header, min(times, 5)), " s", most)
             for header, most in headers]
    return {name: (value, unit, most) for name, value, unit, most in rows}


def number(value):
    """Three digits that matter."""
    return f"{value:,.0f}" if value >= 100 else f"{value:.3g}"


def goal(text, met):
    return {"text": text if met else text + MISSED, "met": met}


def timed_row(name, row, old):
    """A row of times, with what it is held against."""
    ratio = row["ns"] / row["floor_ns"]
    entry = {"name": name, "ns": row["ns"], "text": number(row["ns"]), "floor": row["floor"], "goals": {},
             "floor_ns": row["floor_ns"], "floor_text": number(row["floor_ns"]), "ratio": ratio}
    if row["at_most_floor"]:
        entry["goals"]["floor"] = goal(f"≤ {row['at_most_floor']:g}", ratio <= row["at_most_floor"])
    if row["over_floor"]:
        over = row["ns"] - row["floor_ns"]
        entry["goals"]["floor"] = goal(f"≤ floor + {row['over_floor']:g} ns", over <= row["over_floor"])
    if "allocations" in row:
        most = row["allocations_at_most"]
        entry["allocations"] = row["allocations"]
        if most >= 0:
            entry["goals"]["allocations"] = goal(f"≤ {most:.3g}", row["allocations"] <= most)
    if old:
        entry["baseline"] = number(old["ns"])
        entry["of_baseline"] = row["ns"] / old["ns"]
        if row["at_most_baseline"]:
            most = row["at_most_baseline"]
            entry["goals"]["baseline"] = goal(f"≤ {most:g}", entry["of_baseline"] <= most)
    return entry


def thread_row(name, row, old):
    """What a second thread brings, in times of one thread's work."""
    gain = row["one_ns"] / row["two_ns"]
    floor = row["floor_one_ns"] / row["floor_two_ns"]
    entry = {"name": name, "text": f"{gain:.2f}×", "floor": row["floor"], "floor_text": f"{floor:.2f}×",
             "ratio": gain / floor, "goals": {"floor": goal(f"≥ {LEAST_GAIN}", gain / floor >= LEAST_GAIN)}}
    if old:
        entry["baseline"] = f"{old['one_ns'] / old['two_ns']:.2f}×"
    return entry


def cost_row(name, cost, old):
    value, unit, most = cost
    entry = {"name": name, "value": value, "text": number(value) + unit, "goals": {}}
    if most is not None:
        entry["goals"]["floor"] = goal(f"≤ {most}{unit}", value <= most)
    if old:
        entry["baseline"] = number(old[0]) + unit
        entry["of_baseline"] = value / old[0] if old[0] else None
    return entry


def all_entries(arguments):
    build = arguments.build
    times = 3 if arguments.short else 40
    old_rows, old_costs = {}, {}
    if arguments.baseline:
        old_build = pathlib.Path(arguments.baseline[1])
        old_rows = measured(old_build, arguments.passes)
        old_costs = costs_of(old_build, build, times)
    entries = []
    for name, row in measured(build, arguments.passes).items():
        make = thread_row if "two_ns" in row else timed_row
        entries.append(make(name, row, old_rows.get(name)))
    return entries + [cost_row(name, cost, old_costs.get(name)) for name, cost in costs_of(build, build, times).items()]


def table(entries, baseline):
    """The table's head and its lines of texts."""
    head = ["operation", "ns", "floor", "floor ns", "× floor", "goal", "allocations", "goal"]
    if baseline:
        head += [baseline[0], "× " + baseline[0], "goal"]

    def line(entry):
        def mark(kind):
            return entry["goals"][kind]["text"] if kind in entry["goals"] else ""

        def ratio(key):
            return f"{entry[key]:.3g}" if entry.get(key) is not None else ""

        texts = [entry["name"], entry["text"], entry.get("floor", ""), entry.get("floor_text", ""), ratio("ratio"),
                 mark("floor"), ratio("allocations"), mark("allocations")]
        return texts + ([entry.get("baseline", ""), ratio("of_baseline"), mark("baseline")] if baseline else [])

    return head, [line(entry) for entry in entries]


TEXT_COLUMNS = (0, 2)


def plain(head, lines):
    widths = [max(len(line[i]) for line in [head] + lines) for i in range(len(head))]

    def laid_out(line):
        return "  ".join(text.ljust(width) if i in TEXT_COLUMNS else text.rjust(width)
                         for i, (text, width) in enumerate(zip(line, widths))).rstrip()

    return "\n".join([laid_out(head), "  ".join("-" * width for width in widths)] + [laid_out(x) for x in lines])


def markdown(head, lines):
    rule = ["---" if i in TEXT_COLUMNS else "---:" for i in range(len(head))]
    return "\n".join("| " + " | ".join(line) + " |" for line in [head, rule] + lines)


def summary(entries):
    """How many goals are met."""
    goals = [each["met"] for entry in entries for each in entry["goals"].values()]
    return f"{sum(goals)} of {len(goals)} goals met; {MISSED.strip()} marks a miss"


def reasons():
    """What is known of rows that miss, by the row's name: the sections of a file of their own."""
    sections = re.split(r"^## (.*)\n", REASONS.read_text(), flags=re.M)
    return {name: text.strip() for name, text in zip(sections[1::2], sections[2::2])}


def missed(entries):
    """The page's section on the rows that miss a goal; empty when none does."""
    known = reasons()
    names = [entry["name"] for entry in entries if not all(each["met"] for each in entry["goals"].values())]
    texts = [f"**{name}**: {known.get(name) or known.get(name.split(':')[0], 'not looked into')}" for name in names]
    return "\n\n".join(["", "## What is missed, and why", *texts]) + "\n" if texts else ""


def machine():
    processor = re.search(r"model name\s*:\s*(.*)", pathlib.Path("/proc/cpuinfo").read_text())
    return {"date": datetime.date.today().isoformat(), "processor": processor[1] if processor else platform.machine(),
            "processors": len(re.findall(r"^processor", pathlib.Path("/proc/cpuinfo").read_text(), re.M)),
            "system": f"{platform.freedesktop_os_release()['PRETTY_NAME']}, Linux {platform.release()}",
            "compiler": output_of("c++", "--version").splitlines()[0], "libc": " ".join(platform.libc_ver()),
            "commit": output_of("git", "rev-parse", "--short", "HEAD").strip()}


# The picture's rows, one for each kind of operation.
SHOWN = ("getClassId, found", "getClassId, not found: unrelated", "setProperty: 8", "setKeyProperty: 4",
         "getProperty of an instance: ", "setProperty: wide", "addKey", "getValue", "path to moniker", "moniker to path",
         "createObjectPath", "getClassId of a path", "trace point", "ValidateInput, clean, 16", "AStringToWString, 16",
         "WStringToAString, 16", "date", "array setter, 64 numbers,", "array setter, 64 texts", "array getter",
         "ReadUint32", "WriteUint32", "whole request", "getInstance")


def draw(entries, path):
    """How long each operation and its floor take, one above the other, narrow enough for a phone."""
    import matplotlib  # pylint: disable=import-outside-toplevel
    matplotlib.use("Agg")
    from matplotlib import pyplot  # pylint: disable=import-outside-toplevel
    shown = [entry for entry in entries if "ns" in entry and entry["name"].startswith(SHOWN)]
    pyplot.rcParams.update({"svg.hashsalt": "oxahv", "svg.fonttype": "none"})
    figure, axes = pyplot.subplots(figsize=(5, 0.36 * len(shown) + 1), layout="constrained")
    for i, entry in enumerate(shown):
        axes.plot([entry["floor_ns"], entry["ns"]], [i, i], color="#9bb5aa", linewidth=2, zorder=1)
        axes.text(0.01, i - 0.28, f"{entry['name']}: {entry['text']} ns", fontsize=9, va="center",
                  transform=axes.get_yaxis_transform())
    rows = range(len(shown))
    axes.scatter([entry["floor_ns"] for entry in shown], rows, marker="|", s=60, color="#444", label="floor", zorder=2)
    axes.scatter([entry["ns"] for entry in shown], rows, s=28, color="#2a7f62", label="operation", zorder=3)
    axes.set_xscale("log")
    axes.set_ylim(len(shown) - 0.4, -0.8)
    axes.set_yticks([])
    axes.set_xlabel("nanoseconds", fontsize=9)
    axes.grid(axis="x", color="#ddd", linewidth=0.6)
    axes.spines[["top", "right", "left"]].set_visible(False)
    figure.legend(loc="outside upper left", ncols=2, frameon=False, fontsize=9)
    figure.savefig(path, metadata={"Date": None} if path.suffix == ".svg" else None)


def page(head, lines, entries, facts):
    return f"""# Performance

What each operation costs, beside the least that it can cost. Renewed by `script/bench --record`.

{facts['date']}, commit {facts['commit']}: {facts['processor']}, {facts['processors']} processors; {facts['system']};
{facts['compiler']}; {facts['libc']}.

- **ns** is the shortest time of one call (or of one unit, where the name says so) in several hundred interleaved
  slices; a row "two threads" shows how many times one thread's work two do; the rows at the end show their own unit.
- **floor** is what the operation cannot undercut, or is held against.
- **allocations** counts the heap blocks taken per call.
- Broker and logger do next to nothing, so that the times are the library's own.
- {summary(entries)}.

![How long each operation and its floor take](performance.svg)

{markdown(head, lines)}
{missed(entries)}"""


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("build", type=pathlib.Path, help="the build folder")
    parser.add_argument("--passes", type=int, required=True)
    parser.add_argument("--json", type=pathlib.Path, required=True, help="where every number goes")
    parser.add_argument("--baseline", nargs=2, metavar=("REV", "BUILD"))
    parser.add_argument("--record", type=pathlib.Path, metavar="FOLDER", help="writes page and picture there")
    parser.add_argument("--short", action="store_true")
    arguments = parser.parse_args()

    entries = all_entries(arguments)
    facts = machine()
    head, lines = table(entries, arguments.baseline)
    print(plain(head, lines))
    print("\n" + summary(entries))
    for name in reasons().keys() - {part for entry in entries for part in (entry["name"], entry["name"].split(":")[0])}:
        print(f"{REASONS.name} explains a row that does not exist: {name}")
    arguments.json.write_text(json.dumps({"machine": facts, "rows": entries}, indent=1, ensure_ascii=False))
    if arguments.record:
        arguments.record.mkdir(exist_ok=True)
        (arguments.record / "performance.md").write_text(page(head, lines, entries, facts))
        draw(entries, arguments.record / "performance.svg")


if __name__ == "__main__":
    main()
