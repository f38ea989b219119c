#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Lets many processes verify many jobs of one store at the same time. Checks that each job is
closed exactly when it should be, and that nothing is lost or done twice.

  try-many-jobs.py BUILD FOLDER [STORE] [--jobs N] [--processes N] [--stops N --server FOLDER]

STORE is the address of the store to create: a folder, or a connection service such as "tintgate" of
with-postgres.sh. Of ten jobs, four are stored measurements; three are to be measured; one has two
strips, measured by two runs; and two are nested and have a parent: one run measures them for all
three. Tickets are checked during and after the runs.

Each process runs at its own place. No two places measure the same values, and at every other place
the jobs fail, but each place measures all its jobs alike. So a ticket shows whether a result comes
completely from the expected run.

With --stops, the PostgreSQL server of with-postgres.sh's FOLDER (by default, the server of the
command that it runs) is stopped N times, as by a crash, at random moments. Then each run must end
with a documented code in time; each array of a ticket and each file must be complete or absent; a
run's writes must stop where the server went away; and a job with incomplete results must be
complete after a reset and another run.
"""

import argparse
import collections
import csv
import dataclasses
import hashlib
import itertools
import json
import os
import queue
import random
import subprocess
import sys
import threading
import time
from pathlib import Path

from demo_jobs import PRINTED, TINTED, TO_MEASURE, Job, Room, Run

# Keys that differ between runs or strips: CMYK is rounded in two ways.
OF_A_RUN = ("Date", "Time", "Comment", "CMYKValues/")
PATCHES = 48  # In the example job.
TIME_LIMIT = 120  # Seconds that a run may take, whatever happens to its server.
ROOTS = {1: "Remote/Measurement", 2: "Remote/Measurement2"}
VERDICTS = {0: (212, "Verification Failed"), 1: (211, "Verified")}  # By approval.
# Keys of a strip in the order in which a run writes them, one change each.
WRITTEN = ["Status", "Approval", "Comment", "Date", "Time", "SpectralValues/Length", "Numpatches",
           "SpectralValues/DValues", "XYZValues/XValues", "LabValues/BValues",
           "CMYKValues/KValues", "Values/Measured", "Values/Approval", "Values/Decimal"]
KINDS = {"stored": [], "single": TO_MEASURE, "two": [*TO_MEASURE, "--two-strips"],
         "nested": [*TO_MEASURE, "--parent", "100000"]}
PATTERN = ["stored", "single", "nested", "stored", "two", "single", "stored", "single", "stored"]


def strips_of(kind):
    return (1, 2) if kind == "two" else (1,)


def keys_of(room, kind, number):
    """The job's keys and files on the server, created once for all jobs of its kind."""
    room.deliver(Job(number, kind, KINDS[kind]))
    exported = json.loads(room.administer("export", f"job/{number}"))
    return exported["tickets"][0]["keys"]


def fill(room, count):
    """Tickets of `count` jobs. Returns their runs, each job's kind and its keys."""
    models = {kind: keys_of(room, kind, 1 + index) for index, kind in enumerate(KINDS)}
    jdf = room.folder / "job.jdf"
    room.administer("file", "get", "/server/temp/job-1.jdf", jdf)
    for index in range(len(KINDS)):
        room.administer("ticket", "delete", f"job/{1 + index}")
    room.administer("ticket", "delete", "job/100000")

    tickets, runs, kinds, number = [], [], {}, 1000
    server = room.folder / "server/temp"
    server.mkdir(parents=True)

    def add(kind, **changes):
        nonlocal number
        number += 1
        keys = dict(models[kind], **changes)
        keys["Output/Jdf/FileName"] = {"string": f"job-{number}.jdf"}
        keys["Input/Title"] = {"string": f"{kind} {number}"}
        (server / f"job-{number}.jdf").write_bytes(jdf.read_bytes())
        tickets.append({"type": 3, "id": number, "keys": keys})
        kinds[number] = kind
        return number

    while len(kinds) < count:
        for kind in PATTERN:
            if kind != "nested":
                job = add(kind)
                runs += [Run(job, kind, strip) for strip in strips_of(kind)]
                continue
            parent = 100000 + number
            tickets.append({"type": 3, "id": parent, "keys": {
                "Input/Title": {"string": "parent"}, "Job/Display/Status": {"int": 0},
                "Workflow/Verify/Active": {"int": 1}}})
            kinds[parent] = "parent"
            first = add(kind, **{"General/ParentID": {"int": parent}})
            add(kind, **{"General/ParentID": {"int": parent}})
            runs.append(Run(first, kind))
    path = room.folder / "tickets.json"
    path.write_text(json.dumps({"format": "tintgate tickets", "version": 1, "tickets": tickets}),
                    encoding="ascii")
    room.administer("import", path)
    room.administer("file", "put", room.folder / "server", "/server")
    return runs, kinds, {ticket["id"]: ticket["keys"] for ticket in tickets}


def ask(room, *words):
    """The output of tintgate-store as bytes. Retries while the server is down."""
    for _ in range(100):
        done = subprocess.run([room.build / "bin/tintgate-store", "--store", room.store, *words],
                              capture_output=True, check=False)
        if done.returncode == 0:
            return done.stdout
        time.sleep(0.3)
    raise RuntimeError(f"tintgate-store {' '.join(words)}: {done.stderr.decode()}")


def ticket_of(room, number):
    return json.loads(ask(room, "export", f"job/{number}"))["tickets"][0]["keys"]


ARRAYS = {"XYZValues/XValues": PATCHES, "CMYKValues/KValues": PATCHES,
          "SpectralValues/DValues": PATCHES * 36, "Values/Measured": 27}


def strip_fault(keys, root):
    """Describes an error in a strip's measurement. Empty if it is complete and counted once."""
    for name, value in {"Status": {"int": 1}, "Numpatches": {"int": PATCHES}}.items():
        if keys.get(f"{root}/{name}") != value:
            return f"{root}/{name} is {keys.get(f'{root}/{name}')}"
    for name, count in ARRAYS.items():
        values = keys.get(f"{root}/{name}", {}).get("double", [])
        if len(values) != count:
            return f"{root}/{name} has {len(values)} values"
    return None if f"{root}/{WRITTEN[-1]}" in keys else f"{root}/{WRITTEN[-1]} is not there"


def torn_arrays(keys):
    return [f"{root}/{name}" for root in ROOTS.values()
            for name, count in ARRAYS.items()
            if f"{root}/{name}" in keys and len(keys[f"{root}/{name}"]["double"]) != count]


def has_gap(keys, root):
    """Whether something was written after something else was not."""
    there = [f"{root}/{name}" in keys for name in WRITTEN]
    return there != sorted(there, reverse=True)


def is_closed(keys):
    return keys["Job/Display/Status"]["int"] in (211, 212)


def fault_of(kind, keys):
    """Describes an error in the ticket of a job that must be closed."""
    roots = [ROOTS[strip] for strip in strips_of(kind)]
    for fault in (strip_fault(keys, root) for root in roots):
        if fault:
            return fault
    # The verdict is that of the strip that came second. If both came at once, it is either's.
    verdicts = [VERDICTS.get(keys.get(f"{root}/Approval", {}).get("int")) for root in roots]
    if None in verdicts:
        return "a strip has no verdict"
    statuses = [keys.get(f"Job/{name}/Status", {}).get("int")
                for name in ("Display", "Identification")]
    message = keys.get("Process/InfoMessage", {}).get("string")
    if (not set(statuses) <= {code for code, _ in verdicts}
            or message not in [text for _, text in verdicts]
            or keys.get("Remote/ShowInVerifier") != {"int": 0}):
        return f"status {statuses}, {message}, for {verdicts}"
    return None


def watch(room, kinds, ended, faults):
    """A job needs all strips' results to be closed. A compared job is never closed."""
    while not ended.wait(0.5):
        for row in json.loads(ask(room, "jobs", "--json")):
            kind = kinds[row["job"]]
            if row["displayStatus"] in (211, 212) and (kind == "stored" or any(
                    row[f"strip{strip}"]["passed"] is None for strip in strips_of(kind))):
                faults.append(f"{kind} job {row['job']} was closed too early")


def hash_of(content):
    return hashlib.sha256(content).hexdigest()


def documented_codes():
    with open("docs/exit-codes.csv", newline="", encoding="utf-8") as file:
        return {int(row["code"]) for row in csv.DictReader(file)}


class Workers:
    """Processes that take runs from one list until it is empty."""

    def __init__(self, room, runs, kinds, stopping):
        self.room, self.kinds, self.stopping = room, kinds, stopping
        self.fresh = hash_of((room.folder / "job.jdf").read_bytes())
        self.lock = threading.Lock()
        self.stopping_ended = threading.Event()
        self.compared = [run for run in runs if kinds[run.job] == "stored"]
        self.left = collections.Counter(run.job for run in runs)  # Remaining runs by job.
        self.places = {}  # The place that last measured a strip of a job.
        self.updated = collections.defaultdict(list)  # Hashes of a job's JDFs written by runs.
        self.repeated = set()
        self.waiting = queue.SimpleQueue()
        for run in runs:
            self.waiting.put(run)
        self.documented = documented_codes()
        self.faults, self.codes, self.seconds = [], collections.Counter(), []

    def work(self, number):
        place = self.room.make_place(f"place-{number}")
        instrument = (TINTED if number % 2 else PRINTED) + f"spectra = yes\nseed = {number}\n"
        while run := self.next_run():
            start = time.monotonic()
            process, folder = self.room.start(dataclasses.replace(run, instrument=instrument),
                                              place)
            try:
                code = process.wait(TIME_LIMIT)
            except subprocess.TimeoutExpired:
                process.kill()
                code = "none within its time"
            self.seconds.append(time.monotonic() - start)
            self.codes[code] += 1
            if code not in self.documented or (code != 0 and not self.stopping):
                self.faults.append(f"job {run.job}, strip {run.strip}: exit code {code}")
            self.note(run, number, folder / f"job-{run.job}.jdf")
            if self.stopping:
                self.look_after(run, code)

    def next_run(self):
        """None when all is done. Until the last stop of the server there is always a run: a
        comparison can be repeated at will.
        """
        try:
            return self.waiting.get_nowait()
        except queue.Empty:
            at_work = self.stopping and not self.stopping_ended.is_set()
            return random.choice(self.compared) if at_work else None

    def note(self, run, number, jdf):
        with self.lock:
            self.left[run.job] -= 1
            is_last = self.left[run.job] == 0
            self.places[run.job, run.strip] = number
            if self.kinds[run.job] != "stored" and jdf.is_file():
                self.updated[run.job].append(hash_of(jdf.read_bytes()))
        if (is_last and not self.stopping and self.kinds[run.job] != "stored"
                and not is_closed(ticket_of(self.room, run.job))):
            self.faults.append(f"job {run.job} was not closed by its last run")

    def look_after(self, run, code):
        """What an operator does after a server crash: has incomplete jobs measured again."""
        keys = ticket_of(self.room, run.job)
        self.faults += [f"job {run.job}: {name} is torn" for name in torn_arrays(keys)]
        kind = self.kinds[run.job]
        root = ROOTS[run.strip]
        if (kind != "stored" and (run.job, run.strip) not in self.repeated
                and has_gap(keys, root)):
            self.faults.append(f"job {run.job}: {root} was written on after a loss")
        if kind == "stored":
            again = code != 0
        elif kind == "nested":
            family = [run.job, run.job + 1, keys["General/ParentID"]["int"]]
            again = any(fault_of("nested", ticket_of(self.room, job)) for job in family)
            if again:
                ask(self.room, "reset", str(run.job), "--family")
        else:
            other = strip_fault(keys, ROOTS[3 - run.strip]) if kind == "two" else None
            again = strip_fault(keys, root) is not None or (not is_closed(keys) and other is None)
            if again:
                ask(self.room, "reset", str(run.job), "--strip", str(run.strip))
        if again:
            self.repeated.add((run.job, run.strip))
            self.waiting.put(run)

    def judge(self, delivered):
        """All tickets and JDFs, after all runs have ended."""
        results = {}  # By place.
        for job, kind in self.kinds.items():
            keys = ticket_of(self.room, job)
            if kind == "stored":  # Comparing stored values changes no ticket.
                fault = None if keys == delivered[job] else "was changed"
            else:
                fault = fault_of(kind, keys) or self.origin_fault(job, kind, keys, results)
            fault = fault or (None if kind == "parent" else self.jdf_fault(job, kind))
            if fault:
                self.faults.append(f"{kind} job {job}: {fault}")
        for one, other in itertools.combinations(results, 2):
            if results[one] == results[other]:
                self.faults.append(f"places {one} and {other} measure alike")

    def origin_fault(self, job, kind, keys, results):
        """Whether a result consists of exactly what its place measures."""
        measured = job - 100000 + 1 if kind == "parent" else job
        if (measured, 1) not in self.places:
            measured -= 1  # The second of two nested jobs.
        for strip in strips_of(kind):
            root = ROOTS[strip] + "/"
            result = {key.removeprefix(root): value for key, value in keys.items()
                      if key.startswith(root) and not key.removeprefix(root).startswith(OF_A_RUN)}
            place = self.places[measured, strip]
            if results.setdefault(place, result) != result:
                return f"strip {strip} is not all from place {place}"
        return None

    def jdf_fault(self, job, kind):
        path = f"/server/temp/job-{job}.jdf"
        versions = json.loads(ask(self.room, "file", "versions", path, "--json"))
        kept = [hash_of(ask(self.room, "file", "get", path, "-", "--version", str(row["version"])))
                for row in versions[:-1]]
        kept.append(hash_of(ask(self.room, "file", "get", path, "-")))
        made = [self.fresh, *self.updated[job]]
        if kind == "nested" and self.updated[job]:
            # A run updates it for each of its three jobs, and the place keeps only the last.
            return None if kept[0] == self.fresh and (self.stopping or (
                len(kept) == 4 and kept[-1] == made[-1])) else f"{len(kept)} versions of the JDF"
        if self.stopping:
            return None if set(kept) <= set(made) else "a JDF is not what a run made"
        return None if sorted(kept) == sorted(made) else "a JDF was lost or delivered twice"


def stop_server(server, count, all_work):
    """Crashes the server this many times."""
    script = [Path(__file__).with_name("with-postgres.sh")]
    try:
        for _ in range(count):
            time.sleep(random.uniform(0.5, 4))
            subprocess.run([*script, "stop", server, "immediate"], check=True)
            time.sleep(random.uniform(0, 1))
            subprocess.run([*script, "again", server], check=True)
    except subprocess.CalledProcessError as failure:
        all_work.faults.append(f"the server can't be stopped and started: {failure}")
    all_work.stopping_ended.set()


def parse_arguments():
    parser = argparse.ArgumentParser(description=__doc__,
                                     formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("build", type=Path)
    parser.add_argument("folder", type=Path, help="is emptied first")
    parser.add_argument("store", nargs="?")
    parser.add_argument("--jobs", type=int, default=400)
    parser.add_argument("--processes", type=int, default=8)
    parser.add_argument("--stops", type=int, default=0)
    parser.add_argument("--server", default=os.path.dirname(os.environ.get("PGSERVICEFILE", "")))
    return parser.parse_args()


def main():
    arguments = parse_arguments()
    room = Room(arguments.build, arguments.folder, arguments.store)
    runs, kinds, delivered = fill(room, arguments.jobs)
    all_work = Workers(room, runs, kinds, arguments.stops > 0)
    ended = threading.Event()
    if arguments.stops:
        beside = threading.Thread(target=stop_server,
                                  args=(arguments.server, arguments.stops, all_work))
    else:
        beside = threading.Thread(target=watch, args=(room, kinds, ended, all_work.faults))
    workers = [threading.Thread(target=all_work.work, args=(number,))
               for number in range(1, arguments.processes + 1)]
    start = time.monotonic()
    for thread in (beside, *workers):
        thread.start()
    for worker in workers:
        worker.join()
    seconds = time.monotonic() - start
    ended.set()
    beside.join()

    all_work.judge(delivered)
    print(f"{len(kinds)} jobs, {len(all_work.seconds)} runs by {arguments.processes} processes in "
          f"{seconds:.0f} s, the longest {max(all_work.seconds):.1f} s")
    print("exit codes: " + ", ".join(f"{code} {times} times" for code, times in
                                      all_work.codes.most_common()))
    print(f"{len(all_work.faults)} faults", *all_work.faults, sep="\n")
    return 1 if all_work.faults else 0


if __name__ == "__main__":
    sys.exit(main())
