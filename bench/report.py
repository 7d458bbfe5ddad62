#!/usr/bin/env python3
"""Makes one table of the passes of a benchmark, of both builds where there is a baseline, and of what loading costs.

Of each number the smallest of all passes counts. script/bench calls this.
"""
import argparse
import datetime
import json
import pathlib
import platform
import re
import subprocess

MOST_INITIALISERS = 3
LEAST_GAIN = 0.97
REASONS = pathlib.Path(__file__).with_name("missed.md")
MET, MISSED = "", " ✗"


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


def load_costs(build, programs, times):
    """What loading a library costs: its name, number, unit and goal."""
    library = found(build, "liboxahvproviderutilities.so.1.*").resolve()
    relocations = sum(int(n) for n in re.findall(r"contains (\d+) entr", output_of("readelf", "-rW", library)))
    section = re.search(r"\.init_array\s+\S+\s+\S+\s+\S+\s+([0-9a-f]+)", output_of("readelf", "-SW", library))
    stripped = build / "stripped.so"
    output_of("strip", "-o", stripped, library)
    loader = found(programs, "oxahvbench-load")
    return {
        "load: relocations": (relocations, "", None),
        # The C compiler's own start-up code has one entry.
        "load: dynamic initialisers": (int(section[1], 16) // 8 - 1, "", MOST_INITIALISERS),
        "load: size, stripped": (stripped.stat().st_size / 1024, " KiB", None),
        "load: dlopen": (min(int(output_of(loader, library)) for _ in range(times)) / 1000, " µs", None),
    }


def number(value):
    """Three digits that matter."""
    return f"{value:,.0f}" if value >= 100 else f"{value:.3g}"


def goal(value, bound, met):
    return {"value": value, "bound": bound, "met": met}


def timed_row(name, row, old):
    """A row of times, with what it is held against."""
    entry = {"name": name, "ns": row["ns"], "floor": row["floor"], "text": number(row["ns"])}
    if "floor_ns" in row:
        ratio = row["ns"] / row["floor_ns"]
        entry["floor_text"] = number(row["floor_ns"])
        entry["floor_ns"] = row["floor_ns"]
        entry["ratio"] = ratio
        if row["at_most_floor"]:
            entry["goal"] = goal(ratio, f"≤ {row['at_most_floor']:g}", ratio <= row["at_most_floor"])
            entry["used"] = ratio / row["at_most_floor"]
        if row.get("over_floor"):
            over = entry["over"] = row["ns"] - row["floor_ns"]
            entry["goal"] = goal(over, f"≤ floor + {row['over_floor']:g} ns", over <= row["over_floor"])
            entry["used"] = row["ns"] / (row["floor_ns"] + row["over_floor"])
    if "naive_ns" in row:
        entry["naive_ns"] = row["naive_ns"]
        entry["faster"] = row["naive_ns"] / row["ns"]
        if row["times_faster"]:
            entry["faster_goal"] = goal(entry["faster"], f"≥ {row['times_faster']:g}",
                                        entry["faster"] >= row["times_faster"])
            entry["used"] = row["times_faster"] / entry["faster"]
    if "allocations" in row:
        most = row["allocations_at_most"]
        entry["allocations"] = row["allocations"]
        if most >= 0:
            entry["allocation_goal"] = goal(row["allocations"], f"≤ {most:.3g}", row["allocations"] <= most)
    if old:
        entry["baseline"] = number(old["ns"])
        entry["speed_up"] = old["ns"] / row["ns"]
    return entry


def thread_row(name, row, old):
    """What a second thread brings, in times of one thread's work."""
    gain = row["one_ns"] / row["two_ns"]
    floor = row["floor_one_ns"] / row["floor_two_ns"]
    entry = {"name": name, "text": f"{gain:.2f}×", "floor": row["floor"], "floor_text": f"{floor:.2f}×",
             "gain": gain, "floor_gain": floor, "ratio": gain / floor,
             "goal": goal(gain / floor, f"≥ {LEAST_GAIN}", gain / floor >= LEAST_GAIN),
             "used": LEAST_GAIN * floor / gain}
    if old:
        entry["baseline"] = f"{old['one_ns'] / old['two_ns']:.2f}×"
    return entry


def load_row(name, cost, old):
    value, unit, most = cost
    entry = {"name": name, "value": value, "text": number(value) + unit}
    if most is not None:
        entry["goal"] = goal(value, f"≤ {most}", value <= most)
    if old:
        entry["baseline"] = number(old[0]) + unit
        entry["speed_up"] = old[0] / value if value else None
    return entry


def all_entries(arguments):
    build = arguments.build
    rows = measured(build, arguments.passes)
    times = 3 if arguments.short else 40
    costs = load_costs(build, build, times)
    old_rows, old_costs = {}, {}
    if arguments.baseline:
        old_build = pathlib.Path(arguments.baseline[1])
        old_rows = measured(old_build, arguments.passes)
        old_costs = load_costs(old_build, build, times)
    entries = []
    for name, row in rows.items():
        make = thread_row if "two_ns" in row else timed_row
        entries.append(make(name, row, old_rows.get(name)))
    return entries + [load_row(name, cost, old_costs.get(name)) for name, cost in costs.items()]


def mark(entry, key):
    return "" if key not in entry else entry[key]["bound"] + (MET if entry[key]["met"] else MISSED)


def table(entries, baseline):
    """The table's head and its lines of texts."""
    head = ["operation", "ns", "floor", "floor ns", "× floor", "goal", "naive ns", "× faster", "goal",
            "allocations", "goal"]
    lines = []
    for entry in entries:
        line = [entry["name"], entry["text"], entry.get("floor", "") if "floor_text" in entry else "",
                entry.get("floor_text", ""), f"{entry['ratio']:.3g}" if "ratio" in entry else "",
                mark(entry, "goal"), number(entry["naive_ns"]) if "naive_ns" in entry else "",
                f"{entry['faster']:.3g}" if "faster" in entry else "", mark(entry, "faster_goal"),
                f"{entry['allocations']:.3g}" if "allocations" in entry else "", mark(entry, "allocation_goal")]
        if baseline:
            line += [entry.get("baseline", ""), f"{entry['speed_up']:.3g}" if entry.get("speed_up") else ""]
        lines.append(line)
    if baseline:
        head += [baseline[0], "speed-up"]
    return head, lines


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


def goals_of(entry):
    """Whether each goal of a row is met."""
    return [entry[key]["met"] for key in ("goal", "faster_goal", "allocation_goal") if key in entry]


def summary(entries):
    """How many goals are met."""
    goals = [met for entry in entries for met in goals_of(entry)]
    return f"{sum(goals)} of {len(goals)} goals met; {MISSED.strip()} marks a miss"


def reasons():
    """What is known of rows that miss, by the row's name: the sections of a file of their own."""
    sections = re.split(r"^## (.*)\n", REASONS.read_text(), flags=re.M)
    return {name: text.strip() for name, text in zip(sections[1::2], sections[2::2])}


def missed(entries):
    """The page's section on the rows that miss a goal; empty when none does."""
    known = reasons()
    names = [entry["name"] for entry in entries if not all(goals_of(entry))]
    texts = [f"**{name}**: {known.get(name) or known.get(name.split(':')[0], 'not looked into')}" for name in names]
    return "\n\n".join(["", "## What is missed, and why", *texts]) + "\n" if texts else ""


def machine():
    processor = re.search(r"model name\s*:\s*(.*)", pathlib.Path("/proc/cpuinfo").read_text())
    return {"date": datetime.date.today().isoformat(), "processor": processor[1] if processor else platform.machine(),
            "processors": len(re.findall(r"^processor", pathlib.Path("/proc/cpuinfo").read_text(), re.M)),
            "system": f"{platform.freedesktop_os_release()['PRETTY_NAME']}, Linux {platform.release()}",
            "compiler": output_of("c++", "--version").splitlines()[0], "libc": " ".join(platform.libc_ver()),
            "commit": output_of("git", "rev-parse", "--short", "HEAD").strip()}


def draw(entries, path):
    """A bar per goal: how much of what the goal allows is used."""
    import matplotlib  # pylint: disable=import-outside-toplevel
    matplotlib.use("Agg")
    from matplotlib import pyplot  # pylint: disable=import-outside-toplevel
    shown = [entry for entry in entries if "used" in entry]
    labels = []
    for entry in shown:
        if "faster_goal" in entry and "goal" not in entry:
            labels.append(f"{entry['faster']:.3g}× faster than naive  (goal {entry['faster_goal']['bound']}×)")
        elif "over" in entry:
            labels.append(f"{entry['over']:.0f} ns over {entry['floor']}  (goal {entry['goal']['bound']})")
        elif "gain" in entry:
            labels.append(f"gains {entry['ratio']:.2f} of what the floor does  (goal {entry['goal']['bound']})")
        else:
            labels.append(f"{entry['ratio']:.3g}× {entry['floor']}  (goal {entry['goal']['bound']}×)")
    used = [entry["used"] for entry in shown]
    pyplot.rcParams.update({"svg.hashsalt": "oxahv", "svg.fonttype": "none"})
    figure, axes = pyplot.subplots(figsize=(13, 0.27 * len(shown) + 1.4), layout="constrained")
    axes.barh(range(len(shown)), used, color=["#2a7f62" if share <= 1 else "#c0392b" for share in used], height=0.72)
    axes.set_xscale("log")
    axes.set_xlim(min(used) / 1.5, max(max(used), 1) * 30)
    axes.axvline(1, color="black", linewidth=1)
    for i, (share, label) in enumerate(zip(used, labels)):
        axes.text(max(share, 1) * 1.06, i, label, va="center", fontsize=8)
    axes.set_yticks(range(len(shown)), [entry["name"] for entry in shown], fontsize=8)
    axes.set_ylim(len(shown) - 0.4, -0.6)
    axes.set_xlabel("share of the goal's allowance (left of the line: met)")
    axes.spines[["top", "right"]].set_visible(False)
    figure.savefig(path, metadata={"Date": None} if path.suffix == ".svg" else None)


def page(head, lines, entries, facts):
    return f"""# Performance

What each operation costs, beside its floor and beside a naive build of the same operation. Renewed by
`script/bench --record`.

{facts['date']}, commit {facts['commit']}: {facts['processor']}, {facts['processors']} processors; {facts['system']};
{facts['compiler']}; {facts['libc']}.

- **ns** is the shortest time of one call (or of one unit, where the name says so) in several hundred interleaved
  slices; a row "two threads" shows how many times one thread's work two do, a row "load" its own unit.
- **floor** is what the operation cannot undercut, or is held against; **naive** a literal build of the operation, with
  string streams, copies and printf (`bench/Naive.cpp`).
- **allocations** counts the heap blocks taken per call.
- Broker and logger do next to nothing, so that the times are the library's own.
- {summary(entries)}.

![How much of each goal's allowance is used](performance.svg)

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
        print(f"{REASONS.name} tells of a row that does not exist: {name}")
    arguments.json.write_text(json.dumps({"machine": facts, "rows": entries}, indent=1, ensure_ascii=False))
    if arguments.record:
        arguments.record.mkdir(exist_ok=True)
        (arguments.record / "performance.md").write_text(page(head, lines, entries, facts))
        draw(entries, arguments.record / "performance.svg")


if __name__ == "__main__":
    main()
