# SPDX-License-Identifier: Apache-2.0
"""Tables of what was measured in memory, the curves, and docs/benchmarks.md."""
import os
import platform
import re
import subprocess
import time

GROWTH = {
    # question: (title, x axis, what a value counts, whether it should be flat)
    "queue size": ("A token in and a tag read, queue full", "tokens the queue holds", "token", True),
    "tags, creation": ("Making a tag", "tags made", "tag", True),
    "tags, reading one": ("Reading a tag", "tags there are", "read", True),
    "tags, freeing one": ("Freeing one tag and making it again", "tags there are", "tag", True),
    "prefix length": ("Receiving, by prefix length", "bytes of the prefix", "byte", True),
    "suffix length": ("Receiving, by suffix length", "bytes of the suffix", "byte", True),
    "configuration text": ("Config", "bytes of the text", "byte", True),
    "frame length": ("Receiving, by frame length", "bytes of a frame", "byte", True),
}


def figure(value):
    if value >= 100:
        return f"{value:,.0f}"
    return f"{value:.1f}" if value >= 10 else f"{value:.2f}"


def _rows(cases, question):
    for name, case in cases.items():
        head, _, rest = name.partition("/")
        if head == question:
            yield rest, case


def _allocations(case):
    # A handful at the start, spread over many, is none.
    return f"{case['allocations']:.2f}".rstrip("0").rstrip(".")


def bytes_table(cases):
    lines = ["### Bytes, in memory", "",
             "| Loop and framing | ns a byte, 16-byte tokens | ratio to lean | ns a byte, 202-byte "
             "tokens | ratio to lean | allocations a token, 16 / 202 |", "|---|---|---|---|---|---|"]
    table = {}
    for rest, case in _rows(cases, "bytes"):
        name, _, length = rest.rpartition("/")
        table.setdefault(name, {})[int(length)] = case
    lean = {length: case["ns"] / case["per"] for length, case in
            table["obliged loop, lean"].items()}
    for name, by_length in table.items():
        cells = [name]
        for length in (16, 202):
            value = by_length[length]["ns"] / by_length[length]["per"]
            cells += [figure(value), f"{value / lean[length]:.2f}"]
        cells.append(f"{_allocations(by_length[16])} / {_allocations(by_length[202])}")
        lines.append("| " + " | ".join(cells) + " |")
    return "\n".join(lines) + "\n"


def plain_table(cases, title, questions):
    lines = [f"### {title}", "", "| | ns | allocations |", "|---|---|---|"]
    for question in questions:
        for rest, case in _rows(cases, question):
            lines.append(f"| {question} `{rest}` | {figure(case['ns'])} | {_allocations(case)} |")
    return "\n".join(lines) + "\n"


def _points(cases, question):
    points = sorted((int(rest), case["ns"] / case["per"]) for rest, case in _rows(cases, question))
    return points


def growth_table(cases):
    lines = ["### Growth, in memory", "", "Nanoseconds of CPU time for one of what the first column "
             "names.", "", "| | from | to | smallest | largest | worst ratio to the first |",
             "|---|---|---|---|---|---|"]
    for question, (title, axis, unit, _) in GROWTH.items():
        points = _points(cases, question)
        values = [value for _, value in points]
        lines.append(
            f"| {title}: ns a {unit} | {points[0][0]:,} {axis} | {points[-1][0]:,} | "
            f"{figure(min(values))} | {figure(max(values))} | "
            f"{max(values) / values[0]:.2f} |")
    return "\n".join(lines) + "\n"


def memory_tables(cases):
    return {
        "bytes": bytes_table(cases),
        "tags": plain_table(cases, "Tags, SP_Done and a whole token, in memory",
                            ("read", "write", "take")),
        "console": plain_table(cases, "Console commands, in memory", ("console",)),
        "growth": growth_table(cases),
    }


def profile_table(profiles):
    lines = ["### Instructions a byte", "", "| | 16-byte tokens | 202-byte tokens |",
             "|---|---|---|"]
    for which, title in (("lean", "obliged loop, lean"), ("driver", "the driver")):
        lines.append(f"| **{title}** | {profiles[which + '/16']['total']:.1f} | "
                     f"{profiles[which + '/202']['total']:.1f} |")
        small, large = (profiles[f"{which}/{length}"]["functions"] for length in (16, 202))
        for name in sorted(set(small) | set(large),
                           key=lambda name: -large.get(name, 0) - small.get(name, 0)):
            lines.append(f"| `{name}` | {small.get(name, 0):.1f} | {large.get(name, 0):.1f} |")
    return "\n".join(lines) + "\n"


def draw(points, title, axis, unit):
    """A curve over a logarithmic axis as SVG."""
    import math
    width, height, left, right, top, bottom = 480, 240, 64, 20, 36, 44
    top_value = max(value for _, value in points) * 1.15
    low, high = math.log10(points[0][0]), math.log10(points[-1][0])
    span = high - low or 1

    def place(x, value):
        return (left + (width - left - right) * (math.log10(x) - low) / span,
                height - bottom - (height - top - bottom) * value / top_value)

    parts = [f'<svg xmlns="http://www.w3.org/2000/svg" viewBox="0 0 {width} {height}" '
             f'font-family="sans-serif" font-size="12">',
             f'<rect width="{width}" height="{height}" fill="#fff"/>',
             f'<text x="{left}" y="20" font-size="14">{title}: ns a {unit}</text>']
    for step in range(5):
        value = top_value * step / 4
        _, y = place(points[0][0], value)
        parts.append(f'<line x1="{left}" y1="{y:.1f}" x2="{width - right}" y2="{y:.1f}" '
                     f'stroke="#ddd"/><text x="{left - 6}" y="{y + 4:.1f}" '
                     f'text-anchor="end">{figure(value) if step else 0}</text>')
    dots = [place(x, value) for x, value in points]
    parts.append('<polyline fill="none" stroke="#0a5" stroke-width="2" points="' +
                 " ".join(f"{x:.1f},{y:.1f}" for x, y in dots) + '"/>')
    for (x, y), (number, _) in zip(dots, points):
        parts.append(f'<circle cx="{x:.1f}" cy="{y:.1f}" r="3" fill="#0a5"/>'
                     f'<text x="{x:.1f}" y="{height - bottom + 18}" '
                     f'text-anchor="middle">{number:,}</text>')
    parts.append(f'<text x="{(left + width - right) / 2}" y="{height - 8}" '
                 f'text-anchor="middle">{axis}</text></svg>')
    return "<!-- SPDX-License-Identifier: Apache-2.0 -->\n" + "\n".join(parts) + "\n"


def _output(*command):
    try:
        return subprocess.run(command, stdout=subprocess.PIPE, stderr=subprocess.DEVNULL,
                              text=True, check=True).stdout.strip()
    except (OSError, subprocess.CalledProcessError):
        return "unknown"


def _package(name):
    return _output("dpkg-query", "-W", "-f=${Version}", name)


def conditions(how):
    processor = "unknown"
    with open("/proc/cpuinfo") as info:
        for line in info:
            if line.startswith("model name"):
                processor = line.partition(":")[2].strip()
                break
    node = os.environ.get("LOKA_BENCH_NODE", "")
    serialport = _output("node", "-p",
                         f"require('{node}/node_modules/serialport/package.json').version")
    return [
        ("Run", how),
        ("Date", time.strftime("%Y-%m-%d")),
        ("Commit", _output("git", "-C", os.path.dirname(os.path.abspath(__file__)), "rev-parse",
                           "--short", "HEAD")),
        ("Machine", f"{processor}, {os.cpu_count()} processors, Linux {platform.release()}; other "
                    "work may have gone on beside the measurement"),
        ("Compiler", _output("g++", "-dumpfullversion") + ", RelWithDebInfo"),
        ("Peers", f"Boost {_package('libboost-dev')}, gensio {_package('libgensio-dev')}, "
                  f"libserialport {_package('libserialport-dev')}, pyserial "
                  f"{_package('python3-serial')}, node {_output('node', '--version')}, "
                  f"node-serialport {serialport}, Google Benchmark {_package('libbenchmark-dev')}"),
    ]


class Targets:
    """Judges what was measured against what is wanted."""

    def __init__(self, figures, summary):
        self.figures = figures
        self.summary = summary
        self.lines = ["| Figure | Measured | Target | |", "|---|---|---|---|"]

    def value(self, question, reader, key):
        part = self.summary(self.figures.get(question, {}).get(reader, []), key)
        return part["median"] if part else None

    def ratio(self, title, question, key, base, most):
        ours, theirs = self.value(question, "loka", key), self.value(question, base, key)
        if ours is not None and theirs:
            self.add(title, f"{ours / theirs:.2f} times {base}", f"at most {most}",
                     ours / theirs <= most)

    def add(self, title, measured, target, is_met):
        self.lines.append(f"| {title} | {measured} | {target} | {'met' if is_met else '**not met**'} |")

    def text(self):
        full, floor = "obliged loop, full", "read and memchr"
        cases = self.figures.get("memory")
        if cases:
            for length in (16, 202):
                lean = cases[f"bytes/obliged loop, lean/{length}"]
                ours = cases[f"bytes/prefix and suffix/{length}"]
                ratio = ours["ns"] / lean["ns"]
                self.add(f"driver in memory, ns a byte, {length}-byte tokens",
                         f"{ratio:.2f} times the lean loop", "at most 1.3", ratio <= 1.3)
        self.ratio("CPU a token of 16 bytes", "throughput_16", "cpu_per_token", full, 0.8)
        self.ratio("the same", "throughput_16", "cpu_per_token", "pyserial packetizer", 1)
        self.ratio("the same, stretch", "throughput_16", "cpu_per_token", "Boost.Asio", 1)
        self.ratio("CPU a token of 202 bytes", "throughput_202", "cpu_per_token", full, 0.7)
        self.ratio("the same, stretch", "throughput_202", "cpu_per_token", "node-serialport", 1)
        for key, name in (("p50_us", "p50"), ("p99_us", "p99")):
            for question, machine in (("latency_idle", "idle"), ("latency_busy", "busy")):
                title = f"latency {name}, {machine} machine"
                self.ratio(title, question, key, floor, 1.2)
                self.ratio(title, question, key, "node-serialport", 1)
                self.ratio(title, question, key, "pyserial packetizer", 1)
        self.ratio("CPU at 115200 baud", "rate_115200", "cpu_percent", full, 1.1)
        self.ratio("the same, stretch", "rate_115200", "cpu_percent", "Boost.Asio", 1.1)
        idle = self.value("rate_0", "loka", "switches_a_second")
        if idle is not None:
            self.add("silent line, context switches a second", f"{idle:.1f}",
                     "2 (one a time-out of 500 ms) and those of start and end", idle <= 6)
        ours, theirs = self.value("start", "loka", "start_ms"), self.value("start", "Boost.Asio",
                                                                          "start_ms")
        if ours is not None and theirs is not None:
            self.add("start-up", f"{ours - theirs:.1f} ms beyond Boost.Asio", "at most 3 ms",
                     ours - theirs <= 3)
        resident = self.value("start", "loka", "rss_kib")
        if resident is not None:
            self.add("resident memory", f"{resident / 1024:.1f} MiB", "below 8 MiB",
                     resident < 8192)
        soak = self.figures.get("soak")
        if soak:
            growth = soak["late_kib"] - soak["early_kib"]
            self.add("memory over a soak", f"{growth} KiB more behind {soak['tokens']:,} tokens",
                     "flat", growth <= 256)
        return "\n".join(self.lines) + "\n"


def write(path, figures, tables, measured_under, summary):
    here = os.path.dirname(os.path.abspath(__file__))
    with open(os.path.join(here, "benchmarks.md.in")) as file:
        text = file.read()
    tables = dict(tables)
    tables["conditions"] = "\n".join(["| | |", "|---|---|"] + [
        f"| {name} | {value} |" for name, value in measured_under]) + "\n"
    tables["targets"] = Targets(figures, summary).text()
    images = os.path.join(os.path.dirname(os.path.abspath(path)), "benchmarks")
    os.makedirs(images, exist_ok=True)
    drawings = []
    for question, (title, axis, unit, _) in GROWTH.items():
        if "memory" not in figures:
            break
        name = "growth-" + question.replace(", ", "-").replace(" ", "-") + ".svg"
        with open(os.path.join(images, name), "w") as file:
            file.write(draw(_points(figures["memory"], question), title, axis, unit))
        drawings.append(f"![{title}: ns a {unit}, by {axis}](benchmarks/{name})")
    tables["drawings"] = "\n".join(drawings) + "\n"
    for key, value in tables.items():
        text = text.replace("{{" + key + "}}\n", value + "\n")
    text = re.sub(r"\{\{[a-z_0-9]+\}\}\n", "Not measured in this run.\n\n", text)
    text = re.sub(r"\n{3,}", "\n\n", text)
    with open(path, "w") as file:
        file.write(text.rstrip("\n") + "\n")
