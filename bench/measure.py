#!/usr/bin/env python3
"""Measures what bench/run has built and refreshes the measured part of RESULTS.md.

usage: measure.py BUILD_DIRECTORY RESULTS_FILE
"""
import glob
import json
import os
import platform
import re
import statistics
import subprocess
import sys
import tempfile

BEGIN = "<!-- measured by bench/run: begin -->"
END = "<!-- measured by bench/run: end -->"
KEYS = ["random", "first row", "last row", "no match"]
REPETITIONS = 15
START_ROUNDS = 2000

# Who else answers a question like it.
PEERS = {
    "GetMccFromCountryCallingCode": "libphonenumber GetRegionCodeForCountryCode",
    "GetCountryNameAlpha2FromCountryCallingCode": "libphonenumber GetRegionCodeForCountryCode",
    "GetCountryCallingCodeFromMcc": "libphonenumber GetCountryCodeForRegion",
    "GetAlpha3CountryCodeFromMcc": "ICU uloc_getISO3Country",
    "GetCountryNameFromMcc": "ICU uloc_getDisplayCountry",
    "GetCountryNameFromCountryCallingCode": "ICU uloc_getDisplayCountry",
}
SINGLE_STEP = [
    "GetCountryCodeFromMcc", "GetCountryNameFromMcc", "GetMccFromCountryCode",
    "GetMccFromServiceCountryCode", "GetServiceCountryCodeFromMcc",
    "GetCountryCallingCodeFromMcc", "GetAlpha3CountryCodeFromMcc",
    "GetMccFromCountryCallingCode",
]
CHAINED = ["GetCountryNameFromCountryCallingCode", "GetCountryNameAlpha2FromCountryCallingCode"]
PREDICATES = ["IsValidMcc", "IsMoSupportMcc"]
SHARED = ["GetInstance", "lock by name", "debug line off", "debug line on"]


def output_of(*command, **options):
    return subprocess.run(command, check=True, text=True, capture_output=True, **options).stdout


def call_times(program):
    """Median processor nanoseconds of every case."""
    report = json.loads(output_of(
        program, "--benchmark_format=json", "--benchmark_min_time=0.02",
        f"--benchmark_repetitions={REPETITIONS}", "--benchmark_enable_random_interleaving=true"))
    times = {}
    for run in report["benchmarks"]:
        if run["run_type"] == "iteration":
            name = re.sub("/iterations:.*", "", run["run_name"])
            times.setdefault(name, []).append(run["cpu_time"])
    return {name: statistics.median(values) for name, values in times.items()}


def call_instructions(program):
    """Instructions of one call of every case, from callgrind's dumps."""
    counts = {}
    with tempfile.TemporaryDirectory() as directory:
        output_of("valgrind", "--tool=callgrind", f"--callgrind-out-file={directory}/dump",
                  program, "--count")
        for path in glob.glob(f"{directory}/dump.*"):
            with open(path, encoding="utf-8") as file:
                dump = file.read()
            name = re.search("Client Request: (.*)", dump)
            if name:
                counts[name[1]] = int(re.search(r"^summary: (\d+)", dump, re.M)[1]) / 8192
    return counts


def service_cases(program):
    """(name, elapsed us, messages) of every case over real services; none where they cannot run."""
    done = subprocess.run([program], text=True, capture_output=True)
    if done.returncode != 0:
        print(done.stderr, file=sys.stderr)
        return []
    rows = (line.split("\t") for line in done.stdout.splitlines())
    return [(name, float(time), float(messages)) for name, time, messages in rows]


def start_instructions(program):
    result = subprocess.run(["valgrind", "--tool=callgrind", "--callgrind-out-file=/dev/null",
                             program], check=True, text=True, capture_output=True)
    return int(re.search(r"Collected : (\d+)", result.stderr)[1])


def starts(binaries):
    """(elapsed us, processor us, instructions) of the shortest application and of the empty one."""
    programs = [f"{binaries}/first_answer", f"{binaries}/empty_with_gio"]
    lines = output_of(f"{binaries}/time_starts", str(START_ROUNDS), *programs).splitlines()
    return [[*map(float, line.split("\t")[1:]), start_instructions(program)]
            for line, program in zip(lines, programs)]


def libraries_loaded(program):
    """Base names of what is loaded from start to the first answer."""
    trace = subprocess.run([program], check=True, text=True, capture_output=True,
                           env={**os.environ, "LD_DEBUG": "libs"}).stderr
    return sorted(set(re.findall(r"calling init: .*/(\S+)", trace)))


def relocations(library):
    kinds = {}
    for kind in re.findall(r"R_\w+", output_of("readelf", "-rW", library)):
        kinds[kind] = kinds.get(kind, 0) + 1
    return kinds


def writable_tables(library):
    """The table symbols that do not stand in read-only data: there should be none."""
    tables = [line for line in output_of("nm", "-C", library).splitlines()
              if re.search(r"coresystem::\w+Table(<\w+>)?::", line)]
    assert tables, "no table found: is the library stripped?"
    return [line for line in tables if line.split()[1] != "r"]


def cpu_model():
    with open("/proc/cpuinfo", encoding="utf-8") as file:
        found = re.search(r"^(?:model name|Model)\s*: (.*)", file.read(), re.M)
    return found[1] if found else platform.machine()


def package_version(package):
    return output_of("dpkg-query", "-W", "-f", "${Version}", package)


def machine():
    packages = ["libbenchmark-dev", "libphonenumber-dev", "libicu-dev", "libglib2.0-dev",
                "libmm-glib-dev", "modemmanager", "network-manager", "libc6", "valgrind"]
    yield f"- Processor: {cpu_model()}, {os.cpu_count()} cores; load {os.getloadavg()[1]:.1f} " \
          "(5 minutes) at the end of the run"
    yield f"- Kernel: {platform.release()}; compiler: {output_of('c++', '--version').splitlines()[0]}"
    yield "- Packages: " + ", ".join(f"{name} {package_version(name)}" for name in packages)


def table(heads, rows):
    yield "| " + " | ".join(heads) + " |"
    yield "|" + " --- |" + " ---: |" * (len(heads) - 1)
    for row in rows:
        yield "| " + " | ".join(row) + " |"


def call_tables(times, counts):
    def cell(case):
        return f"{times[case]:.0f} / {counts[case]:.0f}" if case in times else ""

    def row(name):
        return [name] + [cell(f"{name}/{key}") for key in KEYS]

    names = SINGLE_STEP + CHAINED + PREDICATES
    yield from table(["question: ns / instructions"] + KEYS, map(row, names))
    yield ""
    yield from table(["floor: ns / instructions"] + KEYS,
                     map(row, ["floor " + name for name in SINGLE_STEP]))
    yield ""
    peers = ["hash map " + name for name in SINGLE_STEP] + sorted(set(PEERS.values()))
    yield from table(["peer: ns / instructions"] + KEYS, map(row, peers))
    yield ""
    yield from table(["part", "ns / instructions"], ([name, cell(name + "/-")] for name in SHARED))


def facade_table(times, counts):
    yield from table(["question, over a platform that costs nothing", "ns", "instructions"],
                     ([name.removesuffix("/-"), f"{time:.0f}", f"{counts[name]:.0f}"]
                      for name, time in times.items()))


def service_table(cases):
    if not cases:
        yield "The real services could not be started here."
        return
    yield from table(["question, over the real service", "elapsed us", "messages"],
                     ([name, f"{time:.0f}", f"{messages:.0f}" if messages else ""]
                      for name, time, messages in cases))


def verdict(value, limit, unit=""):
    return f"{value:.2f}{unit}" if unit == "" else f"{value:.0f} {unit}", \
        "met" if value <= limit else "**not met**"


def largest(values):
    """(value, name) of the largest."""
    return max((value, name) for name, value in values.items())


def aims(times, counts, start, memory):
    ratios = {n: times[n + "/random"] / times[f"floor {n}/random"] for n in SINGLE_STEP}
    yield ["end to end over its floor, random keys, median of the eight questions: at most 1.35",
           *verdict(statistics.median(ratios.values()), 1.35)]
    value, name = largest(ratios)
    yield [f"the same, largest ({name}): at most 1.35", *verdict(value, 1.35)]
    over = [n for n in SINGLE_STEP + PREDICATES if counts[n + "/random"] >= 700]
    value, name = largest({n: counts[n + "/random"] for n in SINGLE_STEP + PREDICATES})
    yield [f"instructions, random keys, dearest single question ({name}): under 700"
           + (f"; over it: {len(over)} of {len(SINGLE_STEP + PREDICATES)}" if over else ""),
           *verdict(value, 699, "instructions")]
    value, name = largest({n: times[n + "/last row"] / times[n + "/first row"]
                           for n in SINGLE_STEP})
    yield [f"last row over first row, largest ({name}): at most 1.1", *verdict(value, 1.1)]
    value, name = largest({n: counts[n + "/no match"] for n in SINGLE_STEP + PREDICATES})
    yield [f"instructions without a match, dearest ({name}): under 2,100",
           *verdict(value, 2099, "instructions")]
    for name in ["GetMccFromCountryCallingCode", "GetAlpha3CountryCodeFromMcc"]:
        yield [f"{name} over {PEERS[name]}, random keys: below 1",
               *verdict(times[name + "/random"] / times[PEERS[name] + "/random"], 1)]
    for i, what in enumerate(["elapsed time", "processor time", "instructions"]):
        yield [f"start to first answer over the empty program, {what}: at most 1.15",
               *verdict(start[0][i] / start[1][i], 1.15)]
    yield ["tables outside read-only data, which alone could need relocations: none",
           *verdict(len(memory["writable tables"]), 0, "tables")]
    dirty = sum(kilobytes for permissions, kilobytes in memory["pages"] if "w" not in permissions
                and permissions != "relro")
    yield ["dirty memory in the library's read-only mappings: none", *verdict(dirty, 0, "KiB")]


def memory_of(build, binaries):
    library = f"{build}/lib/libcoresystem.so"
    pages = [line.split("\t") for line in output_of(f"{binaries}/bench_calls", "--pages").splitlines()]
    pages = [(permissions, int(kilobytes)) for permissions, kilobytes in pages]
    # The loader makes the mapping before the writable one read-only once it has relocated it.
    if len(pages) > 1 and pages[-1][0].startswith("rw") and pages[-2][0] == "r--p":
        pages[-2] = ("relro", pages[-2][1])
    return {"pages": pages, "relocations": relocations(library),
            "writable tables": writable_tables(library)}


def report(build):
    binaries = f"{build}/bin"
    start = starts(binaries)
    times = call_times(f"{binaries}/bench_calls")
    counts = call_instructions(f"{binaries}/bench_calls")
    facade = f"{binaries}/bench_facade"
    memory = memory_of(build, binaries)
    loaded = libraries_loaded(f"{binaries}/first_answer")

    yield from machine()
    yield ""
    yield from table(["aim", "measured", "result"], aims(times, counts, start, memory))
    yield ""
    yield from call_tables(times, counts)
    yield ""
    yield from facade_table(call_times(facade), call_instructions(facade))
    yield ""
    yield from service_table(service_cases(f"{binaries}/bench_services"))
    yield ""
    yield from table(["process start to exit", "elapsed us", "processor us", "instructions"],
                     ([name, f"{run[0]:.0f}", f"{run[1]:.0f}", f"{run[2]:,}"] for name, run in
                      zip(["first answer", "empty program with GIO"], start)))
    yield ""
    yield "Loaded from start to first answer: " + ", ".join(loaded) + "."
    yield ""
    yield "Relocations of the library: " + ", ".join(
        f"{count} {kind}" for kind, count in sorted(memory["relocations"].items())) + "."
    yield ""
    yield "Dirty memory of the library's mappings, in KiB: " + ", ".join(
        f"{permissions} {kilobytes}" for permissions, kilobytes in memory["pages"]) + "."


def main():
    build, path = sys.argv[1:]
    measured = "\n".join(report(build))
    print(measured)
    with open(path, encoding="utf-8") as file:
        text = file.read()
    before, rest = text.split(BEGIN)
    with open(path, "w", encoding="utf-8") as file:
        file.write(f"{before}{BEGIN}\n{measured}\n{END}{rest.split(END)[1]}")


if __name__ == "__main__":
    main()
