# SPDX-License-Identifier: Apache-2.0
"""Whole-system measurements over pseudo-terminals: readers in turn A B C A B C, medians and ratios.

Called by scripts/bench.sh, which builds and installs what is needed first.
"""
import argparse
import atexit
import json
import mmap
import os
import random
import signal
import statistics
import struct
import subprocess
import sys
import tempfile
import time
import tty

sys.dont_write_bytecode = True  # nothing of a run stays in the sources
import page  # noqa: E402

PREFIX, SUFFIX = b"\x02", b"\x03"
MOST_UNREAD = 5000  # tokens on their way to a reader with a queue of 10000
HERE = os.path.dirname(os.path.abspath(__file__))


class Reader:
    def __init__(self, name, command, counts=True, heavy=False):
        self.name = name
        self.command = command
        self.counts = counts  # keeps a count of what it has taken where the device can see it
        self.heavy = heavy    # so slow that fewer tokens do

    def __repr__(self):
        return self.name


def all_readers(build):
    def program(name, *more):
        return Reader_for(os.path.join(build, name), more)

    def Reader_for(path, more):
        return [path, more]

    rows = [
        ("read and memchr", program("read_memchr"), True, False),
        ("libserialport", program("read_libserialport"), True, False),
        ("gensio", program("read_gensio"), True, False),
        ("Boost.Asio", program("read_asio"), True, False),
        ("node-serialport", [["node", os.path.join(HERE, "reader/read_node.js")], ()], False, False),
        ("pyserial packetizer",
         [["/usr/bin/python3", os.path.join(HERE, "reader/read_pyserial.py")], ("packetizer",)],
         False, False),
        ("pyserial read_until", [["/usr/bin/python3", os.path.join(HERE, "reader/read_pyserial.py")], ()],
         False, True),
        ("obliged loop, bare", program("read_obliged", "bare"), True, False),
        ("obliged loop, lean", program("read_obliged", "lean"), True, False),
        ("obliged loop, full", program("read_obliged", "full"), True, False),
        ("loka", program("read_loka"), True, False),
    ]
    return [Reader(name, command, counts, heavy) for name, command, counts, heavy in rows]


class Line:
    """A pseudo-terminal pair; the reader opens `path`."""

    def __init__(self):
        self.device, self.host = os.openpty()
        tty.setraw(self.host)
        self.path = os.ttyname(self.host)

    def close(self):
        os.close(self.device)
        os.close(self.host)


class Run:
    """One reader at one end of a line, from its start to its report."""

    def __init__(self, reader, stamps=False):
        self.reader = reader
        self.line = Line()
        self.folder = tempfile.TemporaryDirectory(prefix="loka-bench-")
        self.stamp_file = os.path.join(self.folder.name, "stamps") if stamps else "-"
        progress = os.path.join(self.folder.name, "progress") if reader.counts else "-"
        self.progress = None
        if reader.counts:
            with open(progress, "wb") as file:
                file.write(bytes(8))
            with open(progress, "r+b") as file:
                self.progress = mmap.mmap(file.fileno(), 8)
        program, more = reader.command
        program = program if isinstance(program, list) else [program]
        command = program + [self.line.path, self.stamp_file, progress] + list(more)
        begin = time.monotonic_ns()
        self.process = subprocess.Popen(command, stdout=subprocess.PIPE, text=True)
        # However this ends, no reader goes on and takes time from the next run.
        atexit.register(self.process.kill)
        ready = self.process.stdout.readline()
        self.start_ms = (time.monotonic_ns() - begin) / 1e6
        if ready != "ready\n":
            raise RuntimeError(f"{reader.name} did not start: {command}")
        self.ready_ns = time.monotonic_ns()
        self.sent = 0

    def taken(self):
        return struct.unpack("=Q", self.progress[:8])[0]

    def send(self, data):
        view = memoryview(data)
        while view:
            view = view[os.write(self.line.device, view[:16384]):]

    def send_many(self, frame, count):
        """As fast as the line takes them, with no more on their way than a queue holds."""
        chunk = 200
        block = frame * chunk
        while count > 0:
            if self.progress and self.sent - self.taken() > MOST_UNREAD - chunk:
                time.sleep(0.0002)
                continue
            step = min(chunk, count)
            self.send(block if step == chunk else frame * step)
            self.sent += step
            count -= step

    def resident_kib(self):
        with open(f"/proc/{self.process.pid}/statm") as statm:
            return int(statm.read().split()[1]) * os.sysconf("SC_PAGESIZE") // 1024

    def finish(self, payload=16):
        self.send(PREFIX + b"Z" * payload + SUFFIX)
        report = self.process.stdout.readline()
        end_ns = time.monotonic_ns()
        if self.process.wait(timeout=60) != 0 or not report:
            raise RuntimeError(f"{self.reader.name} ended with {self.process.returncode}")
        result = json.loads(report)
        result["wall_ns"] = end_ns - self.ready_ns
        result["lost"] = self.sent - result["tokens"]
        result["start_ms"] = self.start_ms
        if self.stamp_file != "-":
            with open(self.stamp_file, "rb") as file:
                data = file.read()
            numbers = struct.unpack(f"={len(data) // 8}Q", data)
            result["stamps"] = dict(zip(numbers[::2], numbers[1::2]))
        self.close()
        return result

    def close(self):
        if self.process.poll() is None:
            self.process.kill()
            self.process.wait()
        atexit.unregister(self.process.kill)
        self.process.stdout.close()
        self.line.close()
        self.folder.cleanup()


def frame_of(payload, number=0):
    return PREFIX + (b"%08x" % number + b"x" * payload)[:payload] + SUFFIX


def in_turn(readers, rounds, measure):
    """measure(reader) for each reader in turn, so many rounds; results by reader name."""
    results = {reader.name: [] for reader in readers}
    for _ in range(rounds):
        for reader in readers:
            try:
                results[reader.name].append(measure(reader))
            except (RuntimeError, OSError) as problem:
                print(f"{reader.name}: {problem}", file=sys.stderr)
    return results


def throughput(payload, tokens):
    def measure(reader):
        run = Run(reader)
        count = tokens // 10 if reader.heavy else tokens
        run.send_many(frame_of(payload), count)
        result = run.finish(payload)
        result["cpu_per_token"] = result["cpu_ns"] / max(result["tokens"], 1)
        result["tokens_a_second"] = result["tokens"] / result["wall_ns"] * 1e9
        return result
    return measure


def latency(count):
    def measure(reader):
        run = Run(reader, stamps=True)
        sent_ns = {}
        chance = random.Random(7)
        for number in range(count):
            frame = frame_of(16, number)
            sent_ns[number] = time.monotonic_ns()
            os.write(run.line.device, frame)
            run.sent += 1
            time.sleep(chance.uniform(0.001, 0.003))
        result = run.finish()
        late = sorted((at - sent_ns[number]) / 1000
                      for number, at in result["stamps"].items() if number in sent_ns)
        del result["stamps"]
        result["p50_us"] = late[len(late) // 2]
        result["p99_us"] = late[min(len(late) - 1, len(late) * 99 // 100)]
        return result
    return measure


def at_rate(baud, seconds):
    """Whole frames of 16 bytes as often as a line of that rate brings them; 0 for silence."""
    def measure(reader):
        run = Run(reader)
        if baud == 0:
            time.sleep(seconds)
        else:
            interval = 18 * 10 / baud
            next_at = time.monotonic()
            for number in range(int(seconds / interval)):
                os.write(run.line.device, frame_of(16, number))
                run.sent += 1
                next_at += interval
                time.sleep(max(0, next_at - time.monotonic()))
        result = run.finish()
        wall_s = result["wall_ns"] / 1e9
        result["cpu_percent"] = result["cpu_ns"] / result["wall_ns"] * 100
        result["switches_a_second"] = (result["voluntary"] + result["involuntary"]) / wall_s
        return result
    return measure


def start_up(reader):
    run = Run(reader)
    return run.finish()


class BusyMachine:
    """As many endless loops as there are processors."""

    def __enter__(self):
        self.loops = [subprocess.Popen([sys.executable, "-c", "while True: pass"])
                      for _ in range(os.cpu_count() or 1)]
        return self

    def __exit__(self, *_):
        for loop in self.loops:
            loop.kill()
            loop.wait()


def summary(results, key):
    values = [run[key] for run in results]
    if not values:
        return None
    return {"median": statistics.median(values), "low": min(values), "high": max(values)}


def number(value):
    if value >= 1000:
        return f"{value:,.0f}"
    if value >= 100:
        return f"{value:.0f}"
    if value >= 10:
        return f"{value:.1f}"
    return f"{value:.2f}"


def table(title, results, columns, base):
    """columns: (heading, key); ratios are of the first column to the row `base`."""
    lines = [f"### {title}", ""]
    head = ["Reader"]
    for heading, _ in columns:
        head += [heading, "spread"]
    lines.append("| " + " | ".join(head + [f"ratio to {base}", "lost"]) + " |")
    lines.append("|---|" + "---|" * (len(head) + 1))
    reference = summary(results.get(base, []), columns[0][1])
    for name, runs in results.items():
        if not runs:
            lines.append(f"| {name} | did not run |" + " |" * len(head))
            continue
        cells = [name]
        for _, key in columns:
            part = summary(runs, key)
            cells += [number(part["median"]), f"{number(part['low'])} to {number(part['high'])}"]
        ratio = summary(runs, columns[0][1])["median"] / reference["median"] if reference else 0
        cells += [f"{ratio:.2f}", str(sum(run["lost"] for run in runs))]
        lines.append("| " + " | ".join(cells) + " |")
    return "\n".join(lines) + "\n"


QUESTIONS = ("throughput", "latency", "rates", "start", "soak", "memory", "profile")


def soak(reader, tokens):
    run = Run(reader)
    run.send_many(frame_of(16), tokens // 10)
    early = run.resident_kib()
    run.send_many(frame_of(16), tokens - tokens // 10)
    late = run.resident_kib()
    result = run.finish()
    result["early_kib"], result["late_kib"] = early, late
    return result


def in_memory(build, is_quick):
    """Figures of bench_driver by question and case: CPU nanoseconds and allocations."""
    command = [os.path.join(build, "bench_driver"), "--benchmark_format=json",
               f"--benchmark_min_time={0.005 if is_quick else 0.05}",
               f"--benchmark_repetitions={1 if is_quick else 5}"]
    report = json.loads(subprocess.run(command, stdout=subprocess.PIPE, stderr=subprocess.DEVNULL,
                                       check=True).stdout)
    cases = {}
    for row in report["benchmarks"]:
        if row.get("error_occurred"):
            raise RuntimeError(f"{row['name']}: {row['error_message']}")
        if row["run_type"] != "iteration":
            continue
        unit = {"ns": 1, "us": 1e3, "ms": 1e6}[row["time_unit"]]
        case = cases.setdefault(row["run_name"], {"times": []})
        case["times"].append(row["cpu_time"] * unit)
        case["per"] = row["per"]
        case["allocations"] = row["allocations"]
    for case in cases.values():
        case["ns"] = statistics.median(case.pop("times"))
    return cases


def instructions(build, which, payload, tokens):
    """Instructions of so many tokens: altogether and by function (callgrind)."""
    with tempfile.TemporaryDirectory(prefix="loka-bench-") as folder:
        out = os.path.join(folder, "callgrind")
        subprocess.run(["valgrind", "--tool=callgrind", f"--callgrind-out-file={out}",
                        os.path.join(build, "bench_driver"), "profile", which, str(payload),
                        str(tokens)], check=True, stdout=subprocess.DEVNULL,
                       stderr=subprocess.DEVNULL)
        text = subprocess.run(["callgrind_annotate", "--auto=no", "--threshold=100", out], check=True,
                              stdout=subprocess.PIPE, stderr=subprocess.DEVNULL,
                              text=True).stdout
    functions = {}
    total = 0
    for line in text.splitlines():
        words = line.split()
        if len(words) < 2 or not words[0].replace(",", "").isdigit():
            continue
        count = int(words[0].replace(",", ""))
        if "PROGRAM TOTALS" in line:
            total = count
        elif ":" in line:
            name = line.split(":", 1)[1].replace("(anonymous namespace)::", "").split(" [")[0]
            name = name.split("(")[0].split("@@")[0].replace("[abi:cxx11]", "").strip()
            name = name.replace("std::__cxx11::basic_string<char, std::char_traits<char>, "
                                "std::allocator<char> >", "std::string")
            functions[name] = functions.get(name, 0) + count
    return total, functions


def profile(build, is_quick):
    """Instructions a byte, from the difference of a long and a short run."""
    short, long = (100, 300) if is_quick else (1000, 3000)
    result = {}
    for payload in (16, 202):
        for which in ("lean", "driver"):
            few, few_by_name = instructions(build, which, payload, short)
            many, many_by_name = instructions(build, which, payload, long)
            bytes_more = (long - short) * (payload + 2)
            by_name = {name: (count - few_by_name.get(name, 0)) / bytes_more
                       for name, count in many_by_name.items()}
            result[f"{which}/{payload}"] = {
                "total": (many - few) / bytes_more,
                "functions": {name: count for name, count in by_name.items() if count >= 0.5}}
    return result


def main():
    signal.signal(signal.SIGTERM, lambda *_: sys.exit(1))
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("--build", default="build/release", help="build folder with the readers")
    parser.add_argument("--quick", action="store_true", help="few rounds: shows that all of it runs")
    parser.add_argument("--only", default=",".join(QUESTIONS), help="questions, by commas")
    parser.add_argument("--readers", help="names or parts of names, by commas; all by default")
    parser.add_argument("--rounds", type=int)
    parser.add_argument("--tokens", type=int)
    parser.add_argument("--scale", type=float, default=1,
                        help="of the time that latency and rates take (1)")
    parser.add_argument("--page", help="Markdown file for everything, drawings beside it in benchmarks/")
    parser.add_argument("--from-json", help="write the page from figures of an earlier run")
    parser.add_argument("--json", help="file for every figure")
    options = parser.parse_args()
    if options.from_json:
        with open(options.from_json) as file:
            earlier = json.load(file)
        page.write(options.page, earlier["figures"], earlier["tables"], earlier["conditions"],
                   summary)
        return
    conditions = page.conditions(f"{'quick' if options.quick else 'full'}, rounds "
                                 f"{options.rounds or 'as usual'}, scale {options.scale:g}")
    only = options.only.split(",")
    readers = all_readers(options.build)
    if options.readers:
        wanted = options.readers.split(",")
        readers = [reader for reader in readers if any(part in reader.name for part in wanted)]
    rounds = options.rounds or (1 if options.quick else 7)
    figures = {}
    tables = {}

    def show(key, text):
        tables[key] = text
        print(text, flush=True)

    def ask(key, title, measure, columns, base, rounds=rounds, asked=readers):
        figures[key] = in_turn(asked, rounds, measure)
        show(key, table(title, figures[key], columns, base))

    full = "obliged loop, full"
    floor = "read and memchr"
    tokens = options.tokens or (5000 if options.quick else 200000)
    without_slow = [reader for reader in readers if reader.name != "pyserial read_until"]
    if "throughput" in only:
        for payload in (16, 202):
            ask(f"throughput_{payload}", f"As fast as possible, {payload}-byte tokens",
                throughput(payload, tokens if payload == 16 else tokens // 5),
                [("CPU ns a token", "cpu_per_token"), ("tokens/s", "tokens_a_second")], full,
                asked=readers if payload == 16 else without_slow)
    if "latency" in only:
        count = int((50 if options.quick else 500) * options.scale)
        columns = [("p50 µs", "p50_us"), ("p99 µs", "p99_us")]
        ask("latency_idle", "Latency, idle machine", latency(count), columns, floor)
        with BusyMachine():
            ask("latency_busy", "Latency, busy machine", latency(count), columns, floor,
                rounds=min(rounds, 3))
    if "rates" in only:
        seconds = (0.5 if options.quick else 3) * options.scale
        columns = [("CPU %", "cpu_percent"), ("context switches/s", "switches_a_second")]
        for baud in (9600, 115200):
            ask(f"rate_{baud}", f"A line of {baud} baud, 16-byte tokens one after the other",
                at_rate(baud, seconds), columns, full, rounds=min(rounds, 3))
        ask("rate_0", "A silent line", at_rate(0, seconds),
            [("context switches/s", "switches_a_second"), ("CPU %", "cpu_percent")], full,
            rounds=min(rounds, 3))
    if "start" in only:
        ask("start", "Start-up to a working port, and memory", start_up,
            [("ms", "start_ms"), ("resident KiB", "rss_kib")], "Boost.Asio",
            rounds=2 if options.quick else 2 * rounds + 1)
    if "soak" in only:
        loka = [reader for reader in readers if reader.name == "loka"]
        for reader in loka:
            result = soak(reader, 10000 if options.quick else 1000000)
            figures["soak"] = result
            show("soak", f"Soak: {result['tokens']:,} tokens, {result['lost']} lost, resident "
                 f"{result['early_kib']} KiB after a tenth, {result['late_kib']} KiB at the end.\n")
    if "memory" in only:
        figures["memory"] = in_memory(options.build, options.quick)
        for key, text in page.memory_tables(figures["memory"]).items():
            show(key, text)
    if "profile" in only:
        figures["profile"] = profile(options.build, options.quick)
        show("profile", page.profile_table(figures["profile"]))
    if options.page:
        page.write(options.page, figures, tables, conditions, summary)
    if options.json:
        with open(options.json, "w") as file:
            json.dump({"figures": figures, "tables": tables, "conditions": conditions}, file,
                      indent=1)


if __name__ == "__main__":
    main()
