#!/usr/bin/python3
"""Measures what simulated phones cost: phones.py BUILD. Prints rows for RESULTS.md.

The load of the machine stands beside the figures: nothing here is a test.
"""
import os
import statistics
import subprocess
import sys
import time
from pathlib import Path

CHANGES, CLIENTS, PHONES, STARTS = 1000, 3, 20, 15
# Tells how many changes of the Wi-Fi switch it was told, and when the last one was (since the machine started).
LISTENER = """
import sys, time
from gi.repository import Gio, GLib
bus = Gio.bus_get_sync(Gio.BusType.SYSTEM)
loop, told = GLib.MainLoop(), []
def hear(*signal):
    if "WirelessEnabled" in signal[5].unpack()[1]:
        told.append(time.monotonic())
bus.signal_subscribe("org.freedesktop.NetworkManager", "org.freedesktop.DBus.Properties", "PropertiesChanged",
                     "/org/freedesktop/NetworkManager", None, 0, hear)
bus.call_sync("org.freedesktop.DBus", "/", "org.freedesktop.DBus.Peer", "Ping", None, None, 0, -1)
print("listening", flush=True)
GLib.io_add_watch(GLib.IOChannel.unix_new(0), GLib.IO_HUP, lambda *_: loop.quit())
loop.run()
print(len(told), told[-1] if told else 0)
"""
# Changes the switch, as a client or by writing the file, so many times a second.
CLIENT = """
from gi.repository import Gio, GLib
bus = Gio.bus_get_sync(Gio.BusType.SYSTEM)
def change(i):
    bus.call_sync("org.freedesktop.NetworkManager", "/org/freedesktop/NetworkManager",
                  "org.freedesktop.DBus.Properties", "Set",
                  GLib.Variant("(ssv)", ("org.freedesktop.NetworkManager", "WirelessEnabled",
                                         GLib.Variant("b", bool(i % 2)))), None, 0, -1)
"""
WRITER = """
import os, re
path = os.environ["CORESYSTEM_DEVICE"]
text = open(path).read()
texts = [re.sub('(?m)^wifi = .*', f'wifi = "{state}"', text) for state in ("deactivated", "disconnected")]
def change(i):
    open(path + ".new", "w").write(texts[i % 2])
    os.rename(path + ".new", path)
"""
CHANGER = """
import time
begin = time.monotonic()
for i in range({changes}):
    time.sleep(max(0, begin + i / 1000 - time.monotonic()))
    change(i)
print(begin, time.monotonic())
"""


def run(build, *words, **options):
    return subprocess.run([build / "bin/coresystem", "device", "run", "phone", "--copy", *words], check=True,
                          capture_output=True, text=True, **options).stdout


def start_of(build, *options):
    begin = time.monotonic()
    run(build, *options, "--", "true")
    return 1000 * (time.monotonic() - begin)


def measure_start(build):
    rounds = [(start_of(build, "--services=none"), start_of(build)) for _ in range(STARTS)]
    bare, played = (statistics.median(each) for each in zip(*rounds))
    print(f"| start to exit of `device run -- true`, bare, median of {STARTS} | {bare:.0f} ms |")
    print(f"| the same with all services: beyond a bare one | {played - bare:.0f} ms |")


def told_inside(changer):
    """Runs within `device run`: what each listener heard of the changes."""
    listeners = [subprocess.Popen([sys.executable, "-c", LISTENER], stdin=subprocess.PIPE, stdout=subprocess.PIPE,
                                  text=True) for _ in range(CLIENTS)]
    for each in listeners:
        each.stdout.readline()
    done = subprocess.run([sys.executable, "-c", changer + CHANGER.format(changes=CHANGES)], check=True,
                          capture_output=True, text=True).stdout
    begin, end = map(float, done.split())
    time.sleep(2)  # whoever lags
    for each in listeners:
        count, last = each.communicate()[0].split()
        print(count, CHANGES / (end - begin), 1000 * (float(last) - end))


def measure_changes(build, name, who):
    rows = [tuple(map(float, row.split())) for row in
            run(build, "--", "/usr/bin/python3", __file__, "--inside", who).splitlines()]
    counts, rates, lags = zip(*rows)
    print(f"| {CHANGES} changes by {name}: made a second | {rates[0]:.0f} |")
    print(f"| told to {CLIENTS} clients | {', '.join(f'{count:.0f}' for count in counts)} |")
    print(f"| the last one told after it was made | {max(max(lags), 0):.1f} ms |")


def measure_many(build):
    begin = time.monotonic()
    phones = [subprocess.Popen([build / "bin/coresystem", "device", "run", "phone", "--copy", "--", "sh", "-c",
                                "mmcli -m any >/dev/null && echo ready && read line"], stdin=subprocess.PIPE,
                               stdout=subprocess.PIPE, text=True) for _ in range(PHONES)]
    answers = [phone.stdout.readline() for phone in phones]
    seconds = time.monotonic() - begin
    assert answers == ["ready\n"] * PHONES
    sizes = []
    for status in Path("/proc").glob("[0-9]*/smaps_rollup"):
        try:
            if (status.parent / "comm").read_text() == "coresystem-play\n":
                sizes += [int(line.split()[1]) for line in status.read_text().splitlines() if line.startswith("Pss:")]
        except OSError:
            pass
    for phone in phones:
        phone.communicate("\n")
    print(f"| {PHONES} phones at once: until each has shown its modem to `mmcli` | {seconds:.1f} s |")
    print(f"| memory of the services of one (proportional) | {statistics.median(sizes) / 1024:.1f} MiB |")


def main():
    if sys.argv[1] == "--inside":
        told_inside({"client": CLIENT, "writer": WRITER}[sys.argv[2]])
        return
    build = Path(sys.argv[1]).resolve()
    print("| what | measured |\n| --- | ---: |")
    measure_start(build)
    measure_changes(build, "a client (`Set`)", "client")
    measure_changes(build, "whoever writes the file", "writer")
    measure_many(build)
    print(f"\nLoad of the machine (1 minute): {os.getloadavg()[0]:.1f}, {os.cpu_count()} cores.")


main()
