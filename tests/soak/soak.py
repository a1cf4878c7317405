#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Plays a device with all its faults to a running loka for a while and accounts for every byte.

soak.py LOKA PLUGIN SECONDS: "loka run" on a pseudo-terminal, "loka sub" attached to it, and a client
that asks and changes settings meanwhile. Ends with a table and a verdict; exit status 0 when every
token that was sent has arrived once and in order, every other byte was dropped with a reason, the
plug-in and the host read the same, and memory and descriptors stayed as they were.
"""

import collections
import json
import os
import queue
import random
import signal
import socket
import subprocess
import sys
import tempfile
import threading
import time
import tty

STX, ETX = b"\x02", b"\x03"
GAP_MS = 250
LIMIT_S = 20  # for anything that is waited for
RSS_GROWTH_KIB = 512
MAX_FRAME = 1000


class Device:
    """The other end of the line: a pseudo-terminal behind a link, plugged and pulled at will."""

    def __init__(self, link):
        self.link, self.sent = link, 0
        self.plug()

    def plug(self):
        self.master, self.slave = os.openpty()
        tty.setraw(self.slave)
        fresh = self.link + ".new"
        os.symlink(os.ttyname(self.slave), fresh)
        os.replace(fresh, self.link)

    def pull(self):
        os.unlink(self.link)
        os.close(self.master)
        os.close(self.slave)

    def send(self, data):
        self.sent += len(data)
        while data:
            data = data[os.write(self.master, data):]


class Client:
    """A client of the control socket."""

    def __init__(self, path):
        self.socket = socket.socket(socket.AF_UNIX)
        self.socket.settimeout(LIMIT_S)
        self.socket.connect(path)
        self.input = b""
        self.count = 0

    def ask(self, **request):
        self.count += 1
        self.socket.sendall(json.dumps(dict(request, id=self.count)).encode() + b"\n")
        while b"\n" not in self.input:
            part = self.socket.recv(65536)
            if not part:
                raise RuntimeError("the instance has hung up")
            self.input += part
        line, self.input = self.input.split(b"\n", 1)
        answer = json.loads(line)
        if answer.get("id") != self.count:
            raise RuntimeError(f"not the answer to {request}: {answer}")
        return answer


class Watcher(threading.Thread):
    """Reads what "loka sub -j" prints."""

    def __init__(self, process):
        super().__init__(daemon=True)
        self.process = process
        self.tokens = queue.Queue()
        self.count = 0
        self.drops = collections.Counter()
        self.others = collections.Counter()
        self.findings = []

    def run(self):
        for line in self.process.stdout:
            now = time.monotonic()
            event = json.loads(line)
            kind = event["ev"]
            if kind == "token":
                self.tokens.put((bytes.fromhex(event["hex"]), now))
                self.count += 1
            elif kind == "drop":
                self.drops[event["why"]] += len(event["hex"]) // 2
            elif kind == "port":
                self.others[event["state"]] += 1
            elif kind == "finding":
                self.findings.append(event["text"])


class Soak:
    def __init__(self, loka, plugin, seconds, folder):
        self.seconds, self.folder = seconds, folder
        self.environment = dict(os.environ, LOKA_PLUGIN=plugin, XDG_STATE_HOME=folder + "/state",
                                LOKA_RUNTIME_DIR=folder + "/control")
        self.loka = loka
        self.random = random.Random(20261121)
        self.failures = []
        self.latencies = []
        self.counts = collections.Counter()
        self.expected = collections.deque()
        self.samples = []
        self.gap_ms = GAP_MS
        self.is_over = False

    def fail(self, text):
        if len(self.failures) < 20:
            self.failures.append(text)

    def begin(self):
        self.device = Device(self.folder + "/port")
        configuration = ("CfgVer=1 model=1 port=com1 baudrate=115200 parity=none bits=8 stopbits=1 "
                         f"mode=RS-232 rx_prefix=02 rx_suffix=03 gap={GAP_MS} token_queue_size=1000")
        self.errors = open(self.folder + "/stderr", "w+")
        self.run_process = subprocess.Popen([self.loka, "run", self.folder + "/port", "--config",
                                             configuration], env=self.environment,
                                            stderr=self.errors)
        self.await_true(lambda: os.path.exists(self.folder + "/control/com1.sock"), "a socket")
        sub = subprocess.Popen([self.loka, "sub", "--attach", "-j"], env=self.environment,
                               stdout=subprocess.PIPE, stderr=self.errors)
        self.watcher = Watcher(sub)
        self.watcher.start()
        self.client = Client(self.folder + "/control/com1.sock")
        self.console = Client(self.folder + "/control/com1.sock")
        self.talker = threading.Thread(target=self.talk, daemon=True)
        # Nothing is shown before the watcher listens.
        begun = time.monotonic()
        while self.watcher.count == 0 and time.monotonic() - begun < LIMIT_S:
            self.device.send(STX + b"hello" + ETX)
            self.counts["hello"] += 1
            time.sleep(0.2)
        time.sleep(0.5)
        while not self.watcher.tokens.empty():
            self.watcher.tokens.get()
        self.talker.start()

    def await_true(self, condition, what):
        begun = time.monotonic()
        while not condition():
            if time.monotonic() - begun > LIMIT_S:
                raise RuntimeError(f"{what} did not come in {LIMIT_S} s")
            time.sleep(0.005)

    def talk(self):
        """Console commands, tags, statistics and sends, all the time."""
        words = ["help", "info", "get_stat", "tokens_available", "lasterror", "get_token_length"]
        try:
            while not self.is_over:
                word = self.random.choice(words)
                self.console.ask(op="console", line=word.encode().hex())
                for request in ({"op": "stats"}, {"op": "tags"}, {"op": "settings"}):
                    if not self.console.ask(**request)["ok"]:
                        self.fail(f"refused: {request}")
                self.counts["requests"] += 4
                time.sleep(0.05)
        except (RuntimeError, OSError) as error:
            self.fail(f"console traffic: {error}")

    def take(self):
        """Compares what has arrived with what was sent."""
        while not self.watcher.tokens.empty():
            token, arrived = self.watcher.tokens.get()
            if not self.expected:
                self.fail(f"a token that was never sent: {token!r}")
                continue
            wanted, sent, is_late = self.expected.popleft()
            # A busy machine may have kept the device away for as long as the gap between two pieces.
            while token != wanted and is_late and self.expected:
                self.counts["cut by a late piece"] += 1
                wanted, sent, is_late = self.expected.popleft()
            if token != wanted:
                self.fail(f"{token!r} where {wanted!r} was sent")
                return
            self.latencies.append(arrived - sent)
            self.counts["arrived"] += 1

    def drain(self):
        def is_empty():
            self.take()
            if len(self.expected) == 1 and self.expected[0][2]:
                late = self.expected[0][1] + 1 < time.monotonic()
                self.counts["cut by a late piece"] += late
                self.expected = collections.deque() if late else self.expected
            return not self.expected or self.failures
        self.await_true(is_empty, "the last token")
        self.await_true(lambda: self.client.ask(op="stats")["data"]["received_bytes"]
                        == self.device.sent, "the last byte")

    def good(self, in_pieces=False):
        self.counts["sent"] += 1
        body = b"%d %s" % (self.counts["sent"], b"x" * self.random.randrange(60))
        frame = STX + body + ETX
        cut = self.random.randrange(1, len(frame)) if in_pieces else len(frame)
        begun = time.monotonic()
        self.device.send(frame[:cut])
        if in_pieces:
            time.sleep(0.005)
        now = time.monotonic()
        self.device.send(frame[cut:])
        is_late = in_pieces and time.monotonic() - begun > self.gap_ms / 2000
        self.expected.append((body, now, is_late))

    def silence(self):
        time.sleep((self.gap_ms * 2 + 60) / 1000)

    def fault(self):
        kind = self.random.choice(["noise", "cut suffix", "over-long", "settings", "unplug"])
        self.counts[kind] += 1
        if kind == "noise":
            self.device.send(bytes(self.random.randrange(16, 256)
                                   for _ in range(self.random.randrange(1, 30))))
        elif kind == "cut suffix":
            self.device.send(STX + b"no end")
            self.silence()
        elif kind == "over-long":
            self.device.send(STX + b"y" * self.random.randrange(MAX_FRAME, 3 * MAX_FRAME) + ETX)
        elif kind == "settings":
            self.drain()
            self.gap_ms = self.random.choice([200, 250, 300])
            staged = self.client.ask(op="stage", key="gap", value=str(self.gap_ms))
            done = self.client.ask(op="done")
            if not (staged["ok"] and done["ok"] and done["data"]["stored"]):
                self.fail(f"settings: {staged} {done}")
            self.counts["cleared"] += done["data"]["cleared"]
            # The receive pass that is under way ends with the former gap.
            self.silence()
        elif kind == "unplug":
            self.drain()
            if self.random.random() < 0.5:
                self.device.send(STX + b"pulled")
                self.await_true(lambda: self.client.ask(op="stats")["data"]["received_bytes"]
                                == self.device.sent, "the last byte")
            losses = self.watcher.others["lost"]
            self.device.pull()
            self.await_true(lambda: self.watcher.others["lost"] > losses, "the loss")
            self.silence()
            backs = self.watcher.others["back"]
            self.device.plug()
            self.await_true(lambda: self.watcher.others["back"] > backs, "the return")

    def sample(self):
        row = []
        for process in (self.run_process, self.watcher.process):
            with open(f"/proc/{process.pid}/status", encoding="ascii") as status:
                kib = next(int(line.split()[1]) for line in status if line.startswith("VmRSS"))
            row += [kib, len(os.listdir(f"/proc/{process.pid}/fd"))]
        self.samples.append(row)

    def play(self):
        begun = time.monotonic()
        next_sample, next_fault = 0.0, 2.0
        while (elapsed := time.monotonic() - begun) < self.seconds and not self.failures:
            self.good(in_pieces=self.random.random() < 0.05)
            time.sleep(self.random.choice([0, 0.001, 0.002, 0.004]))
            if elapsed >= next_fault:
                self.fault()
                next_fault = elapsed + self.random.uniform(0.1, 0.6)
            if elapsed >= next_sample:
                self.sample()
                next_sample += 1
            self.take()
        self.drain()
        self.silence()

    def judge(self):
        data = self.client.ask(op="stats")["data"]
        frames = sum(data[key] for key in ("token_bytes",)) + 2 * data["tokens"]
        whole = self.counts["sent"] - self.counts["cut by a late piece"]
        checks = [
            ("tokens sent and arrived", whole, self.counts["arrived"]),
            ("tokens counted by the instance", whole + self.counts["hello"], data["tokens"]),
            ("bytes sent and received", self.device.sent, data["received_bytes"]),
            ("bytes in tokens or dropped", data["received_bytes"], frames + data["dropped_bytes"]),
            ("differences between driver and host", 0, data["findings"]),
            ("times unplugged and lost", self.counts["unplug"], data["losses"]),
            ("times plugged and back", self.counts["unplug"], data["reconnects"]),
            ("tokens cleared by settings", 0, self.counts["cleared"]),
        ]
        for name, wanted, found in checks:
            print(f"  {name:<38} {wanted:>9} {found:>9}  {'ok' if wanted == found else 'WRONG'}")
            if wanted != found:
                self.fail(f"{name}: {wanted} and {found}")
        # The first fifth is for what is made once.
        warm = self.samples[len(self.samples) // 5:]
        third = max(len(warm) // 3, 1)
        for name, column in (("loka run", 0), ("loka sub", 2)):
            early = sum(row[column] for row in warm[:third]) / third
            late = sum(row[column] for row in warm[-third:]) / third
            files = sorted({row[column + 1] for row in warm})
            print(f"  {name}: {early:.0f} KiB early, {late:.0f} KiB late; "
                  f"{files[0]} to {files[-1]} descriptors")
            if late - early > RSS_GROWTH_KIB:
                self.fail(f"{name} has grown by {late - early:.0f} KiB")
            # One more or less while the line is away or an answer is under way.
            if files[-1] - files[0] > 2:
                self.fail(f"{name}: from {files[0]} to {files[-1]} descriptors")
        print("  dropped bytes by reason: " +
              ", ".join(f"{why} {count}" for why, count in sorted(self.watcher.drops.items())))
        print("  faults played: " + ", ".join(
            f"{kind} {self.counts[kind]}"
            for kind in ("noise", "cut suffix", "over-long", "settings", "unplug",
                         "cut by a late piece")) +
            f"; requests {self.counts['requests']}")
        marks = sorted(self.latencies)
        if marks:
            points = [marks[min(int(len(marks) * part), len(marks) - 1)]
                      for part in (0.5, 0.9, 0.99, 0.999)] + [marks[-1]]
            print("  from the last byte to the watcher: " + ", ".join(
                f"{name} {point * 1000:.2f} ms"
                for name, point in zip(("median", "90 %", "99 %", "99.9 %", "most"), points)))

    def end(self):
        self.is_over = True
        self.talker.join(LIMIT_S)
        self.run_process.send_signal(signal.SIGTERM)
        if self.run_process.wait(LIMIT_S) != 128 + signal.SIGTERM:
            self.fail(f"loka run ended with {self.run_process.returncode}")
        if self.watcher.process.wait(LIMIT_S) != 6:
            self.fail(f"loka sub ended with {self.watcher.process.returncode}")


def main():
    if len(sys.argv) != 4:
        sys.exit(__doc__)
    with tempfile.TemporaryDirectory(prefix="loka-soak-") as folder:
        soak = Soak(sys.argv[1], sys.argv[2], float(sys.argv[3]), folder)
        try:
            soak.begin()
            soak.play()
            soak.judge()
            soak.end()
        except (RuntimeError, OSError, StopIteration) as error:
            soak.fail(str(error))
        if soak.failures:
            soak.errors.seek(0)
            print("".join(soak.errors.readlines()[-20:]), file=sys.stderr)
            for process in (soak.run_process, soak.watcher.process):
                if process.poll() is None:
                    process.kill()
                    process.wait()
    for failure in soak.failures:
        print(f"soak: {failure}")
    print("soak: FAILED" if soak.failures else
          f"soak: {soak.counts['arrived']} tokens in {soak.seconds:.0f} s, all is accounted for")
    sys.exit(1 if soak.failures else 0)


main()
