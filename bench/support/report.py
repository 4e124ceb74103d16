"""Runs the benchmark programs in rounds and reports how the library compares with its peers.

A program's run is one round, in which contestants take turns; ratios are taken within a round, and
of their distribution over the rounds the report shows the median, least and greatest.
"""

import argparse
import json
import math
import pathlib
import re
import statistics
import subprocess
import sys
import tomllib
from collections import defaultdict

LIBRARY = "pells"
ROOT = pathlib.Path(__file__).resolve().parents[2]
BEGIN, END = "<!-- report: bench/report --docs writes from here -->", "<!-- report ends -->"


class Figures:
    """Times (seconds) and counters of one program: by work, size and contestant, a value a round."""

    def __init__(self, goals):
        self.goals = goals
        self.times = defaultdict(list)
        self.counters = defaultdict(list)

    def add_round(self, entries):
        for entry in entries:
            if entry.get("error_occurred"):
                sys.exit(f"{entry['name']}: {entry['error_message']}")
            work, size, contestant = entry["run_name"].removesuffix("/iterations:1").rsplit("/", 2)
            unit = {"ns": 1e-9, "us": 1e-6, "ms": 1e-3, "s": 1}[entry["time_unit"]]
            self.times[work, int(size), contestant].append(entry["real_time"] * unit)
            if contestant == LIBRARY:
                for name, value in entry.items():
                    if name not in STANDARD_FIELDS and isinstance(value, (int, float)):
                        self.counters[work, int(size), name].append(value)

    def works(self):
        """Each work with its sizes, in the order of the program."""
        sizes = defaultdict(list)
        for work, size, _ in self.times:
            if size not in sizes[work]:
                sizes[work].append(size)
        return sizes

    def contestants(self, work):
        names = [c for w, _, c in self.times if w == work and c != LIBRARY]
        return list(dict.fromkeys(names))

    def ratios(self, work, size, peer):
        """How many times faster than the peer the library was, in each round."""
        return [p / own for p, own in zip(self.times[work, size, peer], self.times[work, size, LIBRARY])]

    def goal(self, work, size, peer):
        for goal in self.goals.get("goal", []):
            if goal["peer"] == peer and re.match(goal["work"], f"{work}/{size}"):
                return goal["at_least"]
        return None

    def missing(self, once):
        """The goals that no figure answers; after a run of the smallest sizes, their peers."""
        if once:
            found = {contestant for _, _, contestant in self.times}
            yield from (f"no {goal['peer']}" for goal in self.goals.get("goal", []) if goal["peer"] not in found)
            return
        rows = {f"{work}/{size}": (work, size) for work, sizes in self.works().items() for size in sizes}
        for goal in self.goals.get("goal", []):
            if not any((*rows[row], goal["peer"]) in self.times for row in rows if re.match(goal["work"], row)):
                yield f"no figure of {goal['peer']} for {goal['work']}"
        for count in self.goals.get("count", []):
            if not any(name == count["counter"] and re.match(count["work"], f"{work}/{size}")
                       for work, size, name in self.counters):
                yield f"no counter {count['counter']} for {count['work']}"


STANDARD_FIELDS = {
    "real_time", "cpu_time", "iterations", "threads", "family_index", "per_family_instance_index",
    "repetitions", "repetition_index",
}


def run_rounds(programs, rounds, once):
    """Runs the programs by turns. Returns their figures and the description of the machine."""
    figures = {}
    for each in range(rounds):
        for program in programs:
            subject = program.name.removeprefix("bench_")
            print(f"round {each + 1} of {rounds}: {subject}", file=sys.stderr)
            # A measurement may be short: it is repeated in every round.
            command = [program, "--benchmark_format=json", "--benchmark_min_time=0.05"]
            done = subprocess.run(command + ["--once"] * once, stdout=subprocess.PIPE, check=True)
            output = json.loads(done.stdout)
            if subject not in figures:
                goals = tomllib.loads((ROOT / f"bench/{subject}.toml").read_text())
                figures[subject] = Figures(goals)
            figures[subject].add_round(output["benchmarks"])
    return figures, output["context"]


def human_time(seconds):
    for unit, factor in (("s", 1), ("ms", 1e-3), ("µs", 1e-6)):
        if seconds >= factor:
            return f"{seconds / factor:.3g} {unit}"
    return f"{seconds / 1e-9:.3g} ns"


def cell(figures, work, size, peer):
    if (work, size, peer) not in figures.times:
        return ""
    ratios = figures.ratios(work, size, peer)
    text = f"{statistics.median(ratios):.2f} ({min(ratios):.2f}–{max(ratios):.2f})"
    goal = figures.goal(work, size, peer)
    if goal is None:
        return text
    met = statistics.median(ratios) >= goal
    return f"{text}, ≥ {goal:g}" if met else f"**{text}, short of {goal:g}**"


def ratio_tables(figures):
    """Tables of the works, one for each set of contestants."""
    groups = defaultdict(list)
    for work in figures.works():
        groups[tuple(figures.contestants(work))].append(work)
    for peers, works in groups.items():
        if not peers:
            continue
        yield f"| Work | Size | {LIBRARY} | " + " | ".join(f"against {peer}" for peer in peers) + " |"
        yield "|---|--:|--:|" + "---|" * len(peers)
        for work in works:
            for size in figures.works()[work]:
                own = human_time(statistics.median(figures.times[work, size, LIBRARY]))
                cells = " | ".join(cell(figures, work, size, peer) for peer in peers)
                yield f"| {work} | {size:,} | {own} | {cells} |"
        yield ""


def limits(figures):
    """The counters and the growth that have a limit, one line each."""
    for count in figures.goals.get("count", []):
        for (work, size, name), values in figures.counters.items():
            if name == count["counter"] and re.match(count["work"], f"{work}/{size}"):
                value = statistics.median(values)
                verdict = "" if value <= count["at_most"] else " **exceeded**"
                yield f"- {work}, {size:,}: {name.replace('_', ' ')} {value:,.4g}, at most {count['at_most']:,}{verdict}"
    for growth in figures.goals.get("growth", []):
        for work, sizes in figures.works().items():
            if re.match(growth["work"], work) and len(sizes) > 1:
                yield growth_line(figures, work, sorted(sizes), growth["at_most"])


def growth_line(figures, work, sizes, law):
    least, greatest = sizes[0], sizes[-1]
    unit_cost = [statistics.median(figures.times[work, size, LIBRARY]) / size for size in (least, greatest)]
    grown = unit_cost[1] / unit_cost[0]
    # Caches end somewhere between the sizes, so a linear cost may still grow by half.
    allowed = math.log(greatest) / math.log(least) if law == "log" else 1.5
    verdict = "" if grown <= allowed else " **exceeded**"
    return (f"- {work}: the cost of a unit at {greatest:,} is {grown:.2f} times that at {least:,}, "
            f"at most {allowed:.2f} ({law}){verdict}")


def plot_growth(figures, subject, folder):
    """Draws the works of three sizes and more; yields the Markdown that shows them."""
    import matplotlib
    matplotlib.use("svg")
    matplotlib.rcParams["svg.hashsalt"] = "pells"
    import matplotlib.pyplot as plt

    for work, sizes in figures.works().items():
        if len(sizes) < 3:
            continue
        figure, axes = plt.subplots(figsize=(5, 3.4), layout="constrained")
        for contestant in [LIBRARY, *figures.contestants(work)]:
            points = [(size, statistics.median(figures.times[work, size, contestant]))
                      for size in sorted(sizes) if (work, size, contestant) in figures.times]
            axes.loglog(*zip(*points), marker="o", label=contestant,
                        linewidth=2.5 if contestant == LIBRARY else 1.2)
        axes.set(title=work, xlabel="size", ylabel="seconds")
        axes.grid(True, which="major", alpha=0.3)
        axes.legend(fontsize="small")
        name = re.sub(r"[^a-z0-9]+", "-", f"{subject}-{work}".lower()) + ".svg"
        figure.savefig(folder / name, metadata={"Date": None})
        plt.close(figure)
        yield f"![{work}: time by size](performance/{name})"


def peer_versions():
    """The Debian packages of the peers, with their versions."""
    listing = subprocess.run([ROOT / "scripts/install-deps", "--list", "bench-peers"], text=True,
                             stdout=subprocess.PIPE, check=True).stdout.split()
    query = ["dpkg-query", "-W", "-f", "${Package} ${Version}\n", *listing]
    return subprocess.run(query, text=True, stdout=subprocess.PIPE, check=True).stdout.splitlines()


def write_report(all_figures, context, rounds, folder):
    """Writes report.md and its plots to the folder. Returns the text."""
    plots = folder / "performance"
    plots.mkdir(parents=True, exist_ok=True)
    lines = [
        f"{rounds} rounds on {context['num_cpus']} processors of {context['mhz_per_cpu']} MHz, "
        f"{context['date'][:10]}, against {', '.join(peer_versions())}.",
        "",
    ]
    for subject, figures in all_figures.items():
        lines += [f"### {subject.capitalize()}", "", *ratio_tables(figures)]
        found = list(limits(figures))
        lines += found + [""] * bool(found)
        shown = list(plot_growth(figures, subject, plots))
        lines += shown + [""] * bool(shown)
    text = "\n".join(lines)
    (folder / "report.md").write_text(text)
    return text


def update_docs(text, folder):
    page = ROOT / "docs/performance.md"
    before, rest = page.read_text().split(BEGIN)
    after = rest.split(END)[1]
    page.write_text(f"{before}{BEGIN}\n\n{text}\n{END}{after}")
    pictures = ROOT / "docs/performance"
    pictures.mkdir(exist_ok=True)
    for old in pictures.glob("*.svg"):
        old.unlink()
    for plot in (folder / "performance").glob("*.svg"):
        (pictures / plot.name).write_bytes(plot.read_bytes())


def main():
    parser = argparse.ArgumentParser(prog="bench/report")
    parser.add_argument("--once", action="store_true", help="only check that every benchmark works")
    parser.add_argument("--rounds", type=int, default=7)
    parser.add_argument("--only", action="append", metavar="SUBJECT", help="such as xml; repeatable")
    parser.add_argument("--docs", action="store_true", help="update docs/performance.md")
    parser.add_argument("--build", type=pathlib.Path, default=ROOT / "build/bench")
    options = parser.parse_args()

    subjects = options.only or sorted(path.stem for path in (ROOT / "bench").glob("*.toml"))
    programs = [options.build / f"bench/bench_{subject}" for subject in subjects]
    rounds = 1 if options.once else options.rounds
    figures, context = run_rounds(programs, rounds, options.once)
    problems = [problem for each in figures.values() for problem in each.missing(options.once)]
    if problems:
        sys.exit("\n".join(problems))
    if options.once:
        print(f"All benchmarks of {', '.join(subjects)} work.")
        return
    folder = options.build / "report"
    text = write_report(figures, context, rounds, folder)
    print(text)
    if options.docs:
        update_docs(text, folder)


main()
