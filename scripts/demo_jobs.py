#!/usr/bin/env python3
"""Verifies jobs of a print server: makes a store with real data, runs the tool on each job as a
client does, and shows what came out.

demo_jobs.py BUILD FOLDER

Each run has a system root and a temporary folder of its own, so that they can run side by side.
"""

import csv
import json
import os
import shutil
import subprocess
import sys
import time
from dataclasses import dataclass, field
from pathlib import Path

ICC = Path("/usr/share/color/icc")
PROFILE = ICC / "ghostscript/default_cmyk.icc"
USER, PASSWORD = "anna", "gate-44"
REMEASURE = "KEY_KZ_REMEASURE:=:true"
PATIENCE = 30  # Seconds for a report, which the tool does not wait for.


@dataclass
class Job:
    number: int
    title: str
    options: list
    strips: tuple = (1,)


@dataclass
class Run:
    """One start of the tool."""
    job: int
    title: str
    strip: int = 1
    remeasure: bool = False
    instrument: dict = field(default_factory=dict)  # Settings of the measuring tool.


STORED = [
    Job(1, "Coated paper, American", ["--measured", ICC / "TR006.ti3", "--paper", "Coated"]),
    Job(2, "Super-calendered paper", []),
    Job(3, "Two strips", ["--measured", ICC / "TR006.ti3", "--paper", "Coated", "--two-strips"],
        (1, 2)),
    Job(4, "Against a profile", ["--references", PROFILE, "--measured", ICC / "TR002.ti3"]),
]


def headline(text):
    print(f"\n{text}\n{'=' * len(text)}")


def meanings():
    with open("docs/exit-codes.csv", newline="", encoding="utf-8") as file:
        return {int(row["code"]): row["meaning"] for row in csv.DictReader(file)}


class Room:
    """A print room: its store, and the programs beside it."""

    def __init__(self, build, folder):
        self.build = build
        self.folder = folder
        self.store = folder / "store"
        shutil.rmtree(folder, ignore_errors=True)
        folder.mkdir(parents=True)
        self.administer("make", "--name", "Print room")
        self.administer("user", "add", USER, "--password-file", "-", text=PASSWORD)

    def administer(self, *words, text=None):
        """What tintgate-store answers."""
        done = subprocess.run([self.build / "bin/tintgate-store", "--store", self.store, *words],
                              input=text, capture_output=True, text=True, check=False)
        if done.returncode != 0:
            sys.exit(f"tintgate-store {' '.join(map(str, words))}: {done.stderr}")
        return done.stdout

    def deliver(self, job):
        """Brings a job to the server, as its clients would."""
        parts = self.folder / f"delivered-{job.number}"
        subprocess.run([sys.executable, "docs/example-job/make-job.py", parts, "--job",
                        str(job.number), "--title", job.title, *job.options],
                       check=True, stdout=subprocess.DEVNULL)
        self.administer("import", parts / "tickets.json")
        self.administer("file", "put", parts / "server", "/server")

    def start(self, run):
        place = self.folder / f"run-{run.job}-{run.strip}{'-again' if run.remeasure else ''}"
        (place / "tmp").mkdir(parents=True)
        subprocess.run(["cmake", "--install", self.build, "--component", "companions", "--prefix",
                        place / "root"], check=True, stdout=subprocess.DEVNULL)
        environment = {name: value for name, value in os.environ.items()
                       if name not in ("DISPLAY", "WAYLAND_DISPLAY")}  # No browser for each.
        environment |= {"TINTGATE_ROOT": str((place / "root").resolve()),
                        "TMPDIR": str((place / "tmp").resolve()), **run.instrument}
        arguments = [f"KEY_KZ_HOST:=:{self.store.resolve()}", f"KEY_KZ_STRIP:=:{run.strip}",
                     f"KEY_KZ_JOBID:=:{run.job}", "KEY_KZ_LANGUAGE:=:en_US", "KEY_KZ_MODE:=:0",
                     f"KEY_KZ_PASSWORD:=:{PASSWORD}", f"KEY_KZ_USER:=:{USER}"]
        if run.remeasure:
            arguments.append(REMEASURE)
        process = subprocess.Popen([self.build / "bin/Tintgate", *arguments], env=environment)
        return process, place / f"tmp/Tintgate/JobID_{run.job}"


def report_of(job_folder):
    """The page that the viewer makes of a run."""
    end = time.monotonic() + PATIENCE
    while time.monotonic() < end:
        pages = sorted(job_folder.glob("report-*.html"))
        if pages:
            return pages[-1]
        time.sleep(0.05)
    return None


def run_all(room, runs, codes):
    """Starts all runs at once and shows a row for each. Returns how many went wrong."""
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


def main(build, folder):
    room = Room(Path(build), Path(folder))
    codes = meanings()

    headline("Jobs that were measured already")
    for job in STORED:
        room.deliver(job)
    print(room.administer("jobs"))
    runs = [Run(job.number, job.title, strip) for job in STORED for strip in job.strips]
    surprises = run_all(room, runs, codes)
    return 1 if surprises else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
