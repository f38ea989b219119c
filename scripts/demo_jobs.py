#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Verifies jobs of a print server: creates a store with real data, runs the tool on each job as a
client does, and shows the results.

demo_jobs.py BUILD FOLDER

Each run has its own system root and temporary folder, so runs can execute in parallel.
"""

import csv
import json
import os
import shutil
import subprocess
import sys
import textwrap
import time
from dataclasses import dataclass
from pathlib import Path

ICC = Path("/usr/share/color/icc")
PROFILE = ICC / "ghostscript/default_cmyk.icc"
USER, PASSWORD = "anna", "gate-44"
REMEASURE = "KEY_KZ_REMEASURE:=:true"
PATIENCE = 30  # Seconds to wait for a report; the tool itself does not wait for it.


@dataclass
class Job:
    number: int
    title: str
    options: list
    strips: tuple = (1,)


@dataclass
class Run:
    """One run of the tool."""
    job: int
    title: str
    strip: int = 1
    remeasure: bool = False
    instrument: str = ""  # Settings of the measuring tool.


STORED = [
    Job(1, "Coated paper, American", ["--measured", ICC / "TR006.ti3", "--paper", "Coated"]),
    Job(2, "Super-calendered paper", []),
    Job(3, "Two strips", ["--measured", ICC / "TR006.ti3", "--paper", "Coated", "--two-strips"],
        (1, 2)),
    Job(4, "Against a profile", ["--references", PROFILE, "--measured", ICC / "TR002.ti3"]),
]


# Jobs still to be measured, printed by the virtual instrument. Never use its results for real
# prints.
PRINTED = f"instrument = virtual\nprofile = {PROFILE}\nerror = 0.6\n"
TINTED = PRINTED + "bias = -1.5 0.5 4\n"
TO_MEASURE = ["--unmeasured", "--references", PROFILE]
UNMEASURED = [
    Job(5, "One strip", TO_MEASURE),
    Job(6, "Two strips", [*TO_MEASURE, "--two-strips"], (1, 2)),
    Job(7, "Nested, left", [*TO_MEASURE, "--parent", "100"]),
    Job(8, "Nested, right", [*TO_MEASURE, "--parent", "100"]),
]
# Batches run one after the other; the runs of a batch run in parallel.
BATCHES = [
    ("One strip, the first of two, and a strip for two nested jobs",
     [Run(5, "One strip", instrument=TINTED), Run(6, "First of two strips", instrument=PRINTED),
      Run(7, "Nested, for both jobs", instrument=PRINTED)]),
    ("The second strip, and the first job again, on a better print",
     [Run(6, "Second of two strips", 2, instrument=PRINTED + "spectra = yes\n"),
      Run(5, "One strip, remeasured", remeasure=True, instrument=PRINTED)]),
]
SHOWN = ["Job/Display/Status", "Process/InfoMessage", "Remote/Measurement/Status",
         "Remote/Measurement/Approval", "Remote/Measurement/Values/Measured",
         "Remote/Measurement2/Approval"]


def headline(text):
    print(f"\n{text}\n{'=' * len(text)}")


def meanings():
    with open("docs/exit-codes.csv", newline="", encoding="utf-8") as file:
        return {int(row["code"]): row["meaning"] for row in csv.DictReader(file)}


class Room:
    """A print room: its store and the companion programs."""

    def __init__(self, build, folder, store=None):
        """`folder` contains the store too, unless it is at another address."""
        self.build = build
        self.folder = folder
        self.store = store or str((folder / "store").resolve())
        shutil.rmtree(folder, ignore_errors=True)
        folder.mkdir(parents=True)
        self.administer("make", "--name", "Print room")
        self.administer("user", "add", USER, "--password-file", "-", text=PASSWORD)

    def administer(self, *words, text=None):
        """The output of tintgate-store."""
        done = subprocess.run([self.build / "bin/tintgate-store", "--store", self.store, *words],
                              input=text, capture_output=True, text=True, check=False)
        if done.returncode != 0:
            sys.exit(f"tintgate-store {' '.join(map(str, words))}: {done.stderr}")
        return done.stdout

    def deliver(self, job):
        """Adds a job to the server, as its clients would."""
        parts = self.folder / f"delivered-{job.number}"
        subprocess.run([sys.executable, "docs/example-job/make-job.py", parts, "--job",
                        str(job.number), "--title", job.title, *job.options],
                       check=True, stdout=subprocess.DEVNULL)
        self.administer("import", parts / "tickets.json")
        self.administer("file", "put", parts / "server", "/server")

    def make_place(self, name):
        """A system root and a temporary folder, used by one run at a time."""
        place = self.folder / name
        (place / "tmp").mkdir(parents=True)
        subprocess.run(["cmake", "--install", self.build, "--component", "companions", "--prefix",
                        place / "root"], check=True, stdout=subprocess.DEVNULL)
        return place

    def start(self, run, place=None):
        """Starts the tool on a run. Returns the process and the job's folder."""
        again = "-again" if run.remeasure else ""
        place = place or self.make_place(f"run-{run.job}-{run.strip}{again}")
        environment = {name: value for name, value in os.environ.items()
                       if name not in ("DISPLAY", "WAYLAND_DISPLAY")}  # Prevents a browser for each run.
        environment |= {"TINTGATE_ROOT": str((place / "root").resolve()),
                        "TMPDIR": str((place / "tmp").resolve())}
        if run.instrument:
            (place / "measure.conf").write_text(run.instrument, encoding="ascii")
            environment["TINTGATE_MEASURE"] = str((place / "measure.conf").resolve())
        arguments = [f"KEY_KZ_HOST:=:{self.store}", f"KEY_KZ_STRIP:=:{run.strip - 1}",
                     f"KEY_KZ_JOBID:=:{run.job}", "KEY_KZ_LANGUAGE:=:en_US", "KEY_KZ_MODE:=:0",
                     f"KEY_KZ_PASSWORD:=:{PASSWORD}", f"KEY_KZ_USER:=:{USER}"]
        if run.remeasure:
            arguments.append(REMEASURE)
        process = subprocess.Popen([self.build / "bin/Tintgate", *arguments], env=environment)
        return process, place / f"tmp/Tintgate/JobID_{run.job}"


def report_of(job_folder):
    """The viewer's page of a run."""
    end = time.monotonic() + PATIENCE
    while time.monotonic() < end:
        pages = sorted(job_folder.glob("report-*.html"))
        if pages:
            return pages[-1]
        time.sleep(0.05)
    return None


def run_all(room, runs, codes):
    """Starts all runs at once and shows a row for each. Returns the number of failures."""
    started = [(run, *room.start(run)) for run in runs]
    surprises = 0
    print(f"\n  {'JOB':>3}  {'STRIP':>5}  {'TITLE':30} {'EXIT':>4}  {'VERDICT':10} LARGEST FAILURE")
    reports = []
    for run, process, job_folder in started:
        code = process.wait()
        result = job_folder / "output.json"
        verdict, failure = "-", codes.get(code, "not in the list")
        if code == 0:
            verdict, failure = verdict_of(json.loads(result.read_text(encoding="ascii")))
            reports.append(report_of(job_folder))
        surprises += code != 0
        print(f"  {run.job:>3}  {run.strip:>5}  {run.title:30} {code:>4}  {verdict:10} {failure}")
    print("\nTheir reports:")
    for report in reports:
        surprises += report is None
        print(f"  {report or 'missing'}")
    return surprises


def verdict_of(result):
    failed = [criterion for criterion in result["criteria"]
              if criterion["used"] and criterion["outcome"] == "fail"]
    if not failed:
        return result["verdict"], ""
    worst = max(failed, key=lambda criterion: criterion["value"] / criterion["tolerance"])
    return result["verdict"], (f"{worst['title']}: {worst['value']:.{worst['decimals']}f}, "
                               f"at most {worst['tolerance']:g} {worst['unit']}")


def show_tickets(room, numbers):
    """What the write-back changes in some tickets."""
    rows = [(f"job {number}", [held(room, number, key) for key in SHOWN]) for number in numbers]
    names = [key.removeprefix("Remote/").replace("Measurement", "M") for key in SHOWN]
    widths = [max(len(name), *(len(values[index]) for _, values in rows))
              for index, name in enumerate(names)]
    print("\n  TICKET   " + "  ".join(f"{name:{width}}" for name, width in zip(names, widths)))
    for ticket, values in rows:
        print(f"  {ticket:8} " + "  ".join(f"{value:{width}}" for value, width in zip(values, widths)))


def held(room, number, key):
    done = subprocess.run([room.build / "bin/tintgate-store", "--store", room.store, "key", "get",
                           f"job/{number}", key], capture_output=True, text=True, check=False)
    values = done.stdout.split("\n")[:-1]
    return "-" if done.returncode != 0 else values[0] if len(values) == 1 else f"{len(values)} values"


def show_jdf(room, number):
    """The element that the write-back adds to a job's JDF, without most of its patches."""
    path = room.folder / f"job-{number}.jdf"
    room.administer("file", "get", f"/server/temp/job-{number}.jdf", path)
    text = path.read_text(encoding="utf-8", errors="replace")
    print(f"\nThe measurement in the JDF of job {number} ({len(text)} bytes, in {path}):\n")
    lines = [line.strip() for line in text.splitlines() if "<tazo:" in line]
    for line in lines[:2]:
        print(textwrap.fill(line, 100, initial_indent="  ", subsequent_indent="      "))
    print(f"  ... and {len(lines) - 2} more lines")
    return len(lines) == 0


def main(build, folder):
    room = Room(Path(build), Path(folder))
    codes = meanings()

    headline("Jobs that were measured already: compared, and shown")
    for job in STORED:
        room.deliver(job)
    print(room.administer("jobs"))
    surprises = run_all(
        room, [Run(job.number, job.title, strip) for job in STORED for strip in job.strips], codes)

    headline("Jobs to be measured: printed by a virtual instrument, results written back")
    # Each JDF is prepared for updates when it is delivered.
    room.administer("key", "set", "system", "System/Jdf/Updates", "int", "6")
    for job in UNMEASURED:
        room.deliver(job)
    numbers = [5, 6, 7, 8, 100]
    show_tickets(room, numbers)
    for title, runs in BATCHES:
        print(f"\n{title}:")
        surprises += run_all(room, runs, codes)
        show_tickets(room, numbers)
    surprises += show_jdf(room, 5)
    print()
    print(room.administer("jobs"))
    return 1 if surprises else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
