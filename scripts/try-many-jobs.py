#!/usr/bin/env python3
"""Has many processes verify many jobs of one store at the same time, and checks that each job is
closed exactly when it should be, that nothing is lost and nothing is done twice.

  try-many-jobs.py BUILD FOLDER [STORE] [--jobs N] [--processes N] [--stops N --server FOLDER]

STORE is the address of a store that is to be made: a folder, or a connection service such as
with-postgres.sh gives, whose name there is "tintgate". Of ten jobs, four are stored measurements,
three are to be measured, one of two strips, which two runs measure, and two are nested and have a
parent: one run measures them for all three. Tickets are judged, and watched while the runs go on.

With --stops the PostgreSQL server of with-postgres.sh's FOLDER is stopped as by a crash so many times,
at random moments. Then each run must end in a documented code within its time, each array of a ticket
must be whole or not there, and a job whose results were cut off must be complete after a reset and
another run.
"""

import argparse
import collections
import csv
import json
import queue
import random
import subprocess
import sys
import threading
import time
from pathlib import Path

from demo_jobs import PRINTED, TO_MEASURE, Job, Room, Run

PATCHES = 48  # Of the example job.
TIME_LIMIT = 120  # Seconds that a run may take, whatever becomes of its server.
MEASURED = PRINTED + "spectra = yes\n"
KINDS = {"stored": [], "single": TO_MEASURE, "two": [*TO_MEASURE, "--two-strips"],
         "nested": [*TO_MEASURE, "--parent", "100000"]}
PATTERN = ["stored", "single", "nested", "stored", "two", "single", "stored", "single", "stored"]


def keys_of(room, kind, number):
    """The job's keys and files on the server, made once for all of its kind."""
    room.deliver(Job(number, kind, KINDS[kind]))
    exported = json.loads(room.administer("export", f"job/{number}"))
    return exported["tickets"][0]["keys"]


def fill(room, count):
    """Tickets of so many jobs. Returns the runs that they take, and each job's kind."""
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
                runs += [Run(job, kind, strip, instrument=MEASURED)
                         for strip in ((1, 2) if kind == "two" else (1,))]
                continue
            parent = 100000 + number
            tickets.append({"type": 3, "id": parent, "keys": {
                "Input/Title": {"string": "parent"}, "Job/Display/Status": {"int": 0},
                "Workflow/Verify/Active": {"int": 1}}})
            kinds[parent] = "parent"
            first = add(kind, **{"General/ParentID": {"int": parent}})
            add(kind, **{"General/ParentID": {"int": parent}})
            runs.append(Run(first, kind, instrument=MEASURED))
    path = room.folder / "tickets.json"
    path.write_text(json.dumps({"format": "tintgate tickets", "version": 1, "tickets": tickets}),
                    encoding="ascii")
    room.administer("import", path)
    room.administer("file", "put", room.folder / "server", "/server")
    return runs, kinds


def ask(room, *words):
    """What tintgate-store answers; asked again while the server is away."""
    for _ in range(100):
        done = subprocess.run([room.build / "bin/tintgate-store", "--store", room.store, *words],
                              capture_output=True, text=True, check=False)
        if done.returncode == 0:
            return done.stdout
        time.sleep(0.3)
    raise RuntimeError(f"tintgate-store {' '.join(words)}: {done.stderr}")


def ticket_of(room, number):
    return json.loads(ask(room, "export", f"job/{number}"))["tickets"][0]["keys"]


ARRAYS = {"XYZValues/XValues": PATCHES, "CMYKValues/KValues": PATCHES,
          "SpectralValues/DValues": PATCHES * 36, "Values/Measured": 27}


def strip_fault(keys, root):
    """What is wrong with the measurement of a strip; nothing where it is whole, and of one run."""
    expected = {"Status": {"int": 1}, "Approval": {"int": 1}, "Numpatches": {"int": PATCHES}}
    for name, value in expected.items():
        if keys.get(f"{root}/{name}") != value:
            return f"{root}/{name} is {keys.get(f'{root}/{name}')}"
    for name, count in ARRAYS.items():
        values = keys.get(f"{root}/{name}", {}).get("double", [])
        if len(values) != count:
            return f"{root}/{name} has {len(values)} values"
    return None


def torn_arrays(keys):
    return [f"{root}/{name}" for root in ("Remote/Measurement", "Remote/Measurement2")
            for name, count in ARRAYS.items()
            if f"{root}/{name}" in keys and len(keys[f"{root}/{name}"]["double"]) != count]


def fault_of(kind, keys):
    status = keys["Job/Display/Status"]["int"]
    if kind == "stored":  # The comparison of stored values changes no ticket.
        return None if status == 208 and keys["Remote/Measurement/Status"]["int"] == 1 else "changed"
    if status != 211 or keys.get("Process/InfoMessage") != {"string": "Verified"}:
        return f"status {status}"
    return strip_fault(keys, "Remote/Measurement") or (
        strip_fault(keys, "Remote/Measurement2") if kind == "two" else None)


def watch(room, jobs, ended, faults):
    """A job of two strips must never be closed while a strip has no result."""
    while not ended.wait(0.5):
        for job in jobs:
            keys = ticket_of(room, job)
            if keys["Job/Display/Status"]["int"] != 208 and not all(
                    f"{root}/Approval" in keys
                    for root in ("Remote/Measurement", "Remote/Measurement2")):
                faults.append(f"job {job} was closed before both strips had a result")


def documented_codes():
    with open("docs/exit-codes.csv", newline="", encoding="utf-8") as file:
        return {int(row["code"]) for row in csv.DictReader(file)}


class Workers:
    """Processes that take runs from one list, until it is empty."""

    def __init__(self, room, runs, kinds, stopping):
        self.room, self.kinds, self.stopping = room, kinds, stopping
        self.waiting = queue.SimpleQueue()
        for run in runs:
            self.waiting.put(run)
        self.documented = documented_codes()
        self.faults, self.codes, self.seconds = [], collections.Counter(), []

    def work(self, place):
        while True:
            try:
                run = self.waiting.get_nowait()
            except queue.Empty:
                return
            start = time.monotonic()
            process, _ = self.room.start(run, place)
            try:
                code = process.wait(TIME_LIMIT)
            except subprocess.TimeoutExpired:
                process.kill()
                code = "none within its time"
            self.seconds.append(time.monotonic() - start)
            self.codes[code] += 1
            if code not in self.documented or (code != 0 and not self.stopping):
                self.faults.append(f"job {run.job}, strip {run.strip}: exit code {code}")
            if self.stopping:
                self.look_after(run, code)

    def look_after(self, run, code):
        """What an operator does after a server's crash: has cut-off jobs measured again."""
        keys = ticket_of(self.room, run.job)
        self.faults += [f"job {run.job}: {name} is torn" for name in torn_arrays(keys)]
        kind = self.kinds[run.job]
        root = "Remote/Measurement" if run.strip == 1 else "Remote/Measurement2"
        if kind == "stored":
            again = code != 0
        elif kind == "nested":
            family = [run.job, run.job + 1, keys["General/ParentID"]["int"]]
            again = any(fault_of("nested", ticket_of(self.room, job)) for job in family)
            if again:
                ask(self.room, "reset", str(run.job), "--family")
        else:
            closed = keys["Job/Display/Status"]["int"] == 211
            other = strip_fault(keys, "Remote/Measurement2" if run.strip == 1 else
                                "Remote/Measurement") if kind == "two" else None
            again = strip_fault(keys, root) is not None or (not closed and other is None)
            if again:
                ask(self.room, "reset", str(run.job), "--strip", str(run.strip))
        if again:
            self.waiting.put(run)


def stop_servers(server, count, ended):
    """Lets the server crash now and then. Returns when it has, or when the runs have ended."""
    script = [Path(__file__).with_name("with-postgres.sh")]
    for _ in range(count):
        if ended.wait(random.uniform(0.5, 4)):
            return
        subprocess.run([*script, "stop", server, "immediate"], check=True)
        time.sleep(random.uniform(0, 1))
        subprocess.run([*script, "again", server], check=True)


def main():
    parser = argparse.ArgumentParser(description=__doc__,
                                     formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("build", type=Path)
    parser.add_argument("folder", type=Path, help="is emptied first")
    parser.add_argument("store", nargs="?")
    parser.add_argument("--jobs", type=int, default=400)
    parser.add_argument("--processes", type=int, default=8)
    parser.add_argument("--stops", type=int, default=0)
    parser.add_argument("--server")
    arguments = parser.parse_args()

    room = Room(arguments.build, arguments.folder, arguments.store)
    runs, kinds = fill(room, arguments.jobs)
    all_work = Workers(room, runs, kinds, arguments.stops > 0)
    ended = threading.Event()
    two_strips = [job for job, kind in kinds.items() if kind == "two"][:8]
    besides = [threading.Thread(target=watch, args=(room, two_strips, ended, all_work.faults))]
    if arguments.stops:
        besides.append(threading.Thread(target=stop_servers,
                                        args=(arguments.server, arguments.stops, ended)))
    workers = [threading.Thread(target=all_work.work, args=(room.make_place(f"place-{i}"),))
               for i in range(arguments.processes)]
    start = time.monotonic()
    for thread in (*besides, *workers):
        thread.start()
    for worker in workers:
        worker.join()
    seconds = time.monotonic() - start
    ended.set()
    for thread in besides:
        thread.join()

    for job, kind in kinds.items():
        fault = fault_of(kind, ticket_of(room, job))
        if fault:
            all_work.faults.append(f"{kind} job {job}: {fault}")
    print(f"{len(kinds)} jobs, {len(all_work.seconds)} runs by {arguments.processes} processes in "
          f"{seconds:.0f} s, the longest {max(all_work.seconds):.1f} s")
    print("exit codes: " + ", ".join(f"{code} {times} times" for code, times in
                                      all_work.codes.most_common()))
    print(f"{len(all_work.faults)} faults", *all_work.faults, sep="\n")
    return 1 if all_work.faults else 0


if __name__ == "__main__":
    sys.exit(main())
