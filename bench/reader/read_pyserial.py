# SPDX-License-Identifier: Apache-2.0
"""pyserial, read_until up to the suffix. Command line and report: see ReaderReport.h.

A fourth argument "packetizer" takes what has arrived at once and splits it (what
serial.threaded.Packetizer does); without it read_until reads byte by byte.
"""
import json
import resource
import struct
import sys
import time

import serial
import serial.threaded


class Done(Exception):
    pass


class Report:
    def __init__(self, stamp_file):
        self.stamp_file = stamp_file
        self.is_stamping = stamp_file != "-"
        self.stamps = []
        self.tokens = 0
        self.bytes = 0

    def ready(self):
        print("ready", flush=True)
        self.usage = resource.getrusage(resource.RUSAGE_SELF)
        self.cpu_ns = time.process_time_ns()

    def on_token(self, token):
        if token[:1] == b"Z":
            self.finish()
            return False
        self.tokens += 1
        self.bytes += len(token)
        if self.is_stamping:
            self.stamps.append((int(token[:8], 16), time.monotonic_ns()))
        return True

    def finish(self):
        cpu_ns = time.process_time_ns() - self.cpu_ns
        usage = resource.getrusage(resource.RUSAGE_SELF)
        with open("/proc/self/statm") as statm:
            rss_kib = int(statm.read().split()[1]) * resource.getpagesize() // 1024
        print(json.dumps({
            "tokens": self.tokens, "bytes": self.bytes, "cpu_ns": cpu_ns,
            "voluntary": usage.ru_nvcsw - self.usage.ru_nvcsw,
            "involuntary": usage.ru_nivcsw - self.usage.ru_nivcsw, "rss_kib": rss_kib}),
            flush=True)
        if self.is_stamping:
            with open(self.stamp_file, "wb") as file:
                for number, at_ns in self.stamps:
                    file.write(struct.pack("=QQ", number, at_ns))


class Tokens(serial.threaded.Packetizer):
    TERMINATOR = b"\x03"

    def handle_packet(self, packet):
        if not report.on_token(packet[1:]):
            raise Done()


device, stamp_file = sys.argv[1], sys.argv[2]
report = Report(stamp_file)
port = serial.Serial(device, 115200, timeout=None)
report.ready()
if sys.argv[4:] == ["packetizer"]:
    tokens = Tokens()
    try:
        while True:
            tokens.data_received(port.read(port.in_waiting or 1))
    except Done:
        pass
else:
    while report.on_token(port.read_until(b"\x03")[1:-1]):
        pass
