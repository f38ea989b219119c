#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Kills archive, backup and delete at any moment of their work, many times, and looks each time
whether anything is lost: every job and file must be whole in one store at least, a backup that was
cut off must be no store, and the next run must finish what was begun.

scripts/with-postgres.sh scripts/try-kills.py BUILD-FOLDER [--kills 300] [--jobs 12] [--seed 1]

The server's database, the service "tintgate", is used where stores on a server are tried.
"""

import argparse
import json
import os
import random
import shutil
import subprocess
import sys
import tempfile
import time
from pathlib import Path

parser = argparse.ArgumentParser(description=__doc__.split("\n\n")[0])
parser.add_argument("build", type=Path)
parser.add_argument("--kills", type=int, default=300)
parser.add_argument("--jobs", type=int, default=12)
parser.add_argument("--seed", type=int, default=1)
options = parser.parse_args()
program = str(options.build.resolve() / "bin" / "tintgate-store")
folder = Path(tempfile.mkdtemp(prefix="tintgate-kills-"))
rng = random.Random(options.seed)
SERVER = "tintgate"


class Lost(Exception):
    pass


def expect(condition, words):
    if not condition:
        raise Lost(words)


def admin(store, *words, status=0):
    run = subprocess.run([program, "--store", store, *words], capture_output=True, text=True)
    if status is not None and run.returncode != status:
        raise Lost(f"{words}: status {run.returncode}: {run.stderr}")
    return run.stdout


def cut_off(store, *words, longest):
    """Runs a command and kills it at some moment. Whether it was killed."""
    with subprocess.Popen([program, "--store", store, *words], stdout=subprocess.DEVNULL,
                          stderr=subprocess.PIPE) as run:
        time.sleep(rng.uniform(0.2, 1.1) * longest)
        run.kill()
        error = run.stderr.read()
        run.wait()
    if run.returncode not in (0, -9):
        raise Lost(f"{words}: status {run.returncode}: {error}")
    return run.returncode == -9


def clear(store):
    if store == SERVER:
        subprocess.run(["psql", "--quiet", f"service={SERVER}", "--command",
                        "SET client_min_messages = error; DROP SCHEMA IF EXISTS tintgate CASCADE"],
                       check=True)
    else:
        shutil.rmtree(store, ignore_errors=True)


def make(store):
    clear(store)
    admin(store, "make")


def fill(store):
    """Closed jobs, each with a JDF of two versions; every content has a size of its own."""
    tickets = []
    files = folder / "files"
    for job in range(1, options.jobs + 1):
        keys = {"Job/Display/Status": {"int": 211}, "Number": {"int": job},
                "Remote/Measurement/Date": {"string": "2020-01-01"},
                "Output/Jdf/FileName": {"string": f"{job}.jdf"},
                "System/Folders/Temp": {"string": "/temp"},
                "Values": {"double": [job / 7] * 500}}
        if job % 3 == 0:
            keys["General/ParentID"] = {"int": job - 1}
        tickets.append({"type": 3, "id": job, "keys": keys})
    text = json.dumps({"format": "tintgate tickets", "version": 1, "tickets": tickets})
    (folder / "tickets.json").write_text(text)
    admin(store, "import", str(folder / "tickets.json"))
    for version in range(3):
        files.mkdir(exist_ok=True)
        for job in range(1, options.jobs + 1):
            (files / f"{job}.jdf").write_text("<JDF>" + "x" * (job * 1000 + version * 7) + "</JDF>")
        admin(store, "file", "put", str(files), "/temp")


def state(store):
    """Tickets and files: each file with its size and how many versions it has."""
    tickets = {(ticket["type"], ticket["id"]): ticket["keys"]
               for ticket in json.loads(admin(store, "export"))["tickets"] if ticket["type"] == 3}
    files = {file["path"]: (file["size"], file["versions"])
             for file in json.loads(admin(store, "--json", "file", "list"))}
    return tickets, files


def whole_jobs(stored, everything):
    tickets, files = stored
    return {key for key, ticket in tickets.items() if ticket == everything[0][key] and
            files.get(f"/temp/{key[1]}.jdf") == everything[1][f"/temp/{key[1]}.jdf"]}


def try_archive(store, kills):
    other = str(folder / "archive") if store == SERVER else SERVER
    done = 0
    longest = 0
    while done < kills:
        make(store)
        make(other)
        fill(store)
        everything = state(store)
        if longest == 0:
            start = time.monotonic()
            admin(store, "archive", "--closed", "90d", other)
            longest = time.monotonic() - start
            continue
        for _ in range(5):
            if done >= kills or not cut_off(store, "archive", "--closed", "90d", other,
                                            longest=longest):
                break
            done += 1
            here, there = state(store), state(other)
            safe = whole_jobs(here, everything) | whole_jobs(there, everything)
            expect(safe == set(everything[0]), f"lost: {set(everything[0]) - safe}")
            for each in (store, other):
                admin(each, "verify")
        admin(store, "archive", "--closed", "90d", other)
        expect(state(store) == ({}, {}), f"left behind: {state(store)}")
        expect(state(other) == everything, "the archive is not the store that was")
        for each in (store, other):
            admin(each, "verify")
    return done


def try_delete(store, kills):
    done = 0
    longest = 0
    stay = {(3, job) for job in range(options.jobs - 1, options.jobs + 1)}
    while done < kills:
        make(store)
        fill(store)
        everything = state(store)
        going = [str(key[1]) for key in everything[0] if key not in stay]
        if longest == 0:
            start = time.monotonic()
            admin(store, "job", "delete", *going)
            longest = time.monotonic() - start
            continue
        while going:
            killed = done < kills and cut_off(store, "job", "delete", *going, longest=longest)
            if not killed:
                left = state(store)[0]
                going = [job for job in going if (3, int(job)) in left]
                if going:
                    admin(store, "job", "delete", *going)
                break
            done += 1
            tickets, files = state(store)
            expect(stay <= whole_jobs((tickets, files), everything), "a job that was to stay")
            for path in files:
                expect((3, int(path[6:-4])) in tickets, f"{path} is left without its job")
            admin(store, "verify")
            going = [job for job in going if (3, int(job)) in tickets]
        expect(set(state(store)[0]) == stay, "jobs are left")
        expect(len(state(store)[1]) == len(stay), "files are left")
        admin(store, "verify")
    return done


def try_backup(store, kills):
    make(store)
    fill(store)
    everything = state(store)
    backup = str(folder / "backup")
    done = 0
    longest = 0
    while done < kills:
        clear(backup)
        if longest == 0:
            start = time.monotonic()
            admin(store, "backup", backup)
            longest = time.monotonic() - start
            continue
        while done < kills and cut_off(store, "backup", backup, longest=longest):
            done += 1
            expect(state(store) == everything, "a backup changed the store")
            if not Path(backup, "tickets.db").exists():
                admin(backup, "info", status=4)
                continue
            break # It was done when it was killed.
        if not Path(backup, "tickets.db").exists():
            admin(store, "backup", backup)
        expect(state(backup) == everything, "the backup is not the store")
        admin(backup, "verify")
    return done


def main():
    local = str(folder / "store")
    tries = [(try_archive, local), (try_archive, SERVER), (try_delete, local),
             (try_delete, SERVER), (try_backup, local)]
    total = 0
    try:
        for number, (attempt, store) in enumerate(tries):
            share = options.kills * (number + 1) // len(tries) - options.kills * number // len(tries)
            start = time.monotonic()
            done = attempt(store, share)
            total += done
            kind = "a server" if store == SERVER else "a folder"
            print(f"{attempt.__name__[4:]} from {kind}: {done} kills, nothing lost, "
                  f"{time.monotonic() - start:.0f} s", flush=True)
    except Lost as loss:
        print(f"LOST: {loss}\nThe stores are in {folder}", file=sys.stderr)
        return 1
    shutil.rmtree(folder)
    print(f"{total} kills, nothing lost")
    return 0


if "PGSERVICEFILE" not in os.environ:
    sys.exit("try-kills.py: run it with scripts/with-postgres.sh")
sys.exit(main())
