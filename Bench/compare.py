#!/usr/bin/env python3
"""Measures whole processes against each other and prints a table. scripts/bench builds what it runs.

The processes of a row run in turn, so that a change of the machine's mood meets all of them alike. A ratio is made of each
turn; shown are the medians, and of the ratios also the quartiles.
"""

import argparse
import hashlib
import os
import re
import shutil
import statistics
import subprocess
import sys
import tempfile
import time
from pathlib import Path

LIBRARIES = {"vst3": Path("/usr/lib/vst3"), "vst2": Path("/usr/lib/vst")}
KINDS = [*LIBRARIES, "clap"]
BINARY_FOLDER = "Contents/x86_64-linux"


class Process:
    """A command line, run again and again; `prepare` is called before each run, which does not count."""

    def __init__(self, *command, environment=None, prepare=lambda: None):
        self.command = [str(word) for word in command]
        self.environment = environment or {}
        self.prepare = prepare

    def run(self, output=subprocess.DEVNULL):
        """Gives the run's seconds."""
        self.prepare()
        started = time.perf_counter()
        process = subprocess.Popen(self.command, stdin=subprocess.DEVNULL, stdout=output, stderr=subprocess.DEVNULL,
                                   env={**os.environ, **self.environment})
        status = process.wait()
        seconds = time.perf_counter() - started
        if status != 0:
            sys.exit(f"{' '.join(self.command)[:200]} ended with {status}")
        return seconds

    def peak_memory(self):
        """In KiB. Asked by a process of its own, since the system counts in what the one that started it holds."""
        self.prepare()
        measure = "import os, sys; pid = os.posix_spawn(sys.argv[1], sys.argv[1:], os.environ); print(os.wait4(pid, 0)[2].ru_maxrss)"
        ran = subprocess.run([sys.executable, "-S", "-c", measure, *self.command], stdout=subprocess.PIPE,
                             stderr=subprocess.DEVNULL, check=True)
        return int(ran.stdout.split()[-1])


class Case:
    """A folder for one scan: the scan list and what the scan leaves."""

    def __init__(self, bench, name, folders):
        self.effects = bench.work / name / "Effects"
        self.effects.mkdir(parents=True)
        self.list = self.effects / "FXScan.xml"
        paths = "".join(f"\t<Path>{folder}</Path>\n" for folder in folders)
        self.list.write_text(f'<?xml version="1.0" encoding="UTF-8"?>\n<Scan>\n{paths}</Scan>\n')
        self.program = bench.programs / "FxProbe"

    def forget(self):
        for known in [*self.effects.glob("*Configuration.xml"), *self.effects.glob("FXProbes.json")]:
            known.unlink()

    def first_scan(self, jobs=None):
        """In the scanner's own process, or with so many workers."""
        environment = {"FXPROBE_JOBS": str(jobs)} if jobs else {}
        return Process(self.program, self.list, environment=environment, prepare=self.forget)

    def next_scan(self):
        return Process(self.program, self.list)

    def check(self, files, probes):
        """Runs a scan and makes sure that it does what is to be measured."""
        report = self.effects / "report"
        Process(self.program, self.list, environment={"FXPROBE_REPORT": str(report)}).run()
        text = report.read_text()
        report.unlink()
        found = [sum(int(number) for number in re.findall(f'"{what}":([0-9]+)', text)) for what in ("files", "probes")]
        if '"event":"finished"' not in text or found != [files, probes]:
            sys.exit(f"{self.list}: {found} files and probes in place of {[files, probes]}\n{text[:1000]}")


def module_file(path):
    """The binary of a VST 3 bundle, which is what is loaded."""
    return path / BINARY_FOLDER / f"{path.stem}.so" if path.is_dir() else path


def load_arguments(folders):
    arguments = []
    for kind, folder in folders.items():
        pattern = "*.vst3" if kind == "vst3" else "*.so"
        arguments += [kind, *sorted(module_file(path) for path in folder.rglob(pattern))]
    return arguments


class Bench:
    def __init__(self, programs, work, runs):
        self.programs = programs
        self.work = work
        self.runs = runs
        still = self.fixtures("still", 1)
        self.start = self.unchanged("start", still, 1)
        print("| measured | FxProbe | its start | against | ratio | aim |")
        print("|---|---:|---:|---:|---:|---:|")

    def floor(self, folders):
        if "clap" in folders:
            return Process(self.programs / "clap_lister", *sorted(folders["clap"].rglob("*.clap")))
        return Process(self.programs / "load_floor", *load_arguments(folders))

    def row(self, name, ours, other, aim, without_start=True, share=1):
        """Prints a line. The ratio is that of our process, without its start where that is said, to the other. A share of
        the runs is enough for what takes long."""
        turns = []
        for _ in range(max(3, self.runs // share)):
            turns.append([process.run() for process in (ours, self.start, other)])
        net = [(mine - start if without_start else mine) for mine, start, _ in turns]
        ratios = [mine / theirs for mine, (_, _, theirs) in zip(net, turns)]
        low, middle, high = statistics.quantiles(ratios, n=4, method="inclusive")
        mine, start, theirs = (f"{statistics.median(times) * 1000:.1f} ms" for times in zip(*turns))
        print(f"| {name} | {mine} | {start if without_start else ''} | {theirs} | {middle:.2f} ({low:.2f}–{high:.2f}) | {aim} |",
              flush=True)
        return statistics.median(net), statistics.median(times[2] for times in turns)

    def fixtures(self, name, count, kinds=tuple(LIBRARIES)):
        """Folders with so many plug-ins of these formats: links to the scripted ones, without a script."""
        folders = {kind: self.work / name / kind for kind in kinds}
        for kind, folder in folders.items():
            folder.mkdir(parents=True)
            source = self.work / f"{kind}.so"
            if not source.exists():
                shutil.copy(self.programs.parent / "fixtures" / f"scripted_{kind}.so", source)
            for number in range(count):
                path = folder / f"Fixture {kind} {number:05}.so"
                if kind == "vst3":
                    binaries = path.with_suffix(".vst3") / BINARY_FOLDER
                    binaries.mkdir(parents=True)
                    path = binaries / path.name
                if kind == "clap":
                    path = path.with_suffix(".clap")
                os.link(source, path)
        return folders

    def unchanged(self, name, folders, count):
        """A scan of such folders that finds everything in its catalogue. The catalogues are that of one plug-in, repeated:
        a first scan of many thousands takes minutes."""
        case = Case(self, f"{name} case", folders.values())
        model = self.fixtures(f"{name} model plug-ins", 1)
        one = Case(self, f"{name} model case", model.values())
        one.first_scan().run()
        for catalogue in one.effects.glob("*Configuration.xml"):
            text = catalogue.read_text()
            for kind in folders:
                text = text.replace(str(model[kind]), str(folders[kind]))
            head, block, tail = re.fullmatch("(.*?)(\t<Effect>.*</Effect>\n)(.*)", text, re.DOTALL).groups()
            records = [self.renumbered(block, number) for number in range(count)]
            (case.effects / catalogue.name).write_text(head + "".join(sorted(records, key=self.identifier)) + tail)
        case.check(files=2 * count, probes=0)
        return case.next_scan()

    @staticmethod
    def identifier(record):
        return re.search("<ID>(.*)</ID>", record).group(1)

    @staticmethod
    def renumbered(record, number):
        digits = hashlib.md5(str(number).encode()).hexdigest().upper()
        return re.sub("<ID>[0-9A-F]{32}</ID>", f"<ID>{digits}</ID>", record.replace(" 00000", f" {number:05}"))

    def start_and_end(self):
        self.row("start and end, nothing to do", self.start, Process(self.programs / "start_floor"), "", without_start=False)

    def real(self):
        for kinds in (["vst3"], ["vst2"], ["vst3", "vst2"]):
            folders = {kind: LIBRARIES[kind] for kind in kinds}
            case = Case(self, f"real {kinds}", folders.values())
            self.row(f"first scan, real {' and '.join(kinds)}, against the floor", case.first_scan(), self.floor(folders),
                     "1.05")

    def pool(self):
        """Workers against the floor, which is one process."""
        plain = self.work / "plain vst2"
        plain.mkdir()
        for module in LIBRARIES["vst2"].glob("*.so"):
            (plain / module.name).symlink_to(module)
        packages = {"zam-plugins and dpf-plugins": ({"vst3": LIBRARIES["vst3"], "vst2": plain}, "0.7"),
                    "lsp-plugins": ({"vst2": LIBRARIES["vst2"] / "lsp-plugins"}, "0.45")}
        for name, (folders, aim) in packages.items():
            case, floor = Case(self, f"pool {name}", folders.values()), self.floor(folders)
            for jobs in (None, 1, 2, 4, 8):
                workers = f"{jobs} workers" if jobs else "no workers"
                self.row(f"first scan, {name}, {workers}, against the floor", case.first_scan(jobs), floor, aim if jobs == 4 else "",
                         share=3)
        for kind in KINDS:
            count = 1000
            folders = self.fixtures(f"pool {kind}", count, [kind])
            scan, floor = Case(self, f"pool {kind} case", folders.values()).first_scan(4), self.floor(folders)
            net, least = self.row(f"first scan, {count:,} fixtures, {kind}, 4 workers", scan, floor, "", share=4)
            print(f"| … our own for each file | {(net - least) / count * 1e6:.0f} µs | | | | 500 µs |")

    def peers(self):
        libraries = next(iter(Path("/usr/lib").glob("ardour*/")), None)
        for kind, program in {"vst3": "ardour-vst3-scanner", "vst2": "ardour-vst-scanner"}.items():
            if not libraries or not (libraries / program).exists():
                print(f"| {program} is not installed | | | | | |")
                continue
            folder = LIBRARIES[kind]
            home = self.work / f"{program} home"
            home.mkdir()
            files = sorted(folder.rglob("*.vst3" if kind == "vst3" else "*.so"))
            settings = {"environment": {"LD_LIBRARY_PATH": str(libraries), "HOME": str(home), "XDG_CACHE_HOME": str(home)},
                        "prepare": lambda home=home: shutil.rmtree(home)}
            case = Case(self, f"beside {program}", [folder])
            ours = case.first_scan()
            at_once = Process(libraries / program, "-f", "-q", *files, **settings)
            one_each = Process("/bin/sh", "-c", 'program=$1; shift; for file; do "$program" -f -q "$file"; done', "sh",
                               libraries / program, *files, **settings)
            self.row(f"first scan, real {kind}, against {program}, all at once", ours, at_once, "<1", without_start=False)
            self.row(f"… and a process for each file", ours, one_each, "<1", without_start=False, share=2)
            self.row(f"… and a process for each file, against 8 workers", case.first_scan(8), one_each, "<0.33", without_start=False,
                     share=2)

    def unchanged_scans(self):
        for count in (100, 1000, 10000, 20000):
            name = f"unchanged {count}"
            folders = self.fixtures(name, count // 2)
            walk = Process(self.programs / "walk_floor", *folders.values())
            net, _ = self.row(f"nothing changed, {count:,} plug-ins, against a walk",
                              self.unchanged(name, folders, count // 2), walk, "2", share=1 + count // 5000)
            print(f"| … for each plug-in | {net / count * 1e6:.1f} µs | | | | the same |")

    def first_scans(self):
        for kind in KINDS:
            for count in (100, 300, 1000):
                folders = self.fixtures(f"first {kind} {count}", count, [kind])
                scan, floor = Case(self, f"first {kind} {count} case", folders.values()).first_scan(), self.floor(folders)
                net, least = self.row(f"first scan, {count:,} fixtures, {kind}, against the floor", scan, floor, "",
                                      share=1 + count // 300)
                print(f"| … our own for each file | {(net - least) / count * 1e6:.0f} µs | | | | hardly grows |")
            if kind == "clap":  # its floor tells no memory
                continue
            output = tempfile.TemporaryFile()
            floor.run(output)
            output.seek(0)
            peak = int(re.search(rb"(\d+) KiB", output.read()).group(1))
            print(f"| … peak memory | {scan.peak_memory() / 1024:.1f} MiB | {self.start.peak_memory() / 1024:.1f} MiB "
                  f"| {peak / 1024:.1f} MiB | | |")


def main():
    rows = {"start": Bench.start_and_end, "real": Bench.real, "pool": Bench.pool, "peers": Bench.peers, "unchanged": Bench.unchanged_scans,
            "first": Bench.first_scans}
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("programs", type=Path, help="the folder of the built programs")
    parser.add_argument("--runs", type=int, default=20, help="turns of a row; long ones have fewer")
    parser.add_argument("--only", choices=rows, action="append", help="these rows, not all")
    arguments = parser.parse_args()
    os.environ.update({"LC_ALL": "C.UTF-8", "QT_QPA_PLATFORM": "offscreen"})
    with tempfile.TemporaryDirectory(dir=arguments.programs.parent) as work:
        bench = Bench(arguments.programs, Path(work), arguments.runs)
        for name in arguments.only or rows:
            rows[name](bench)


if __name__ == "__main__":
    main()
