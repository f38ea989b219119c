#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Times a run of the job form in stores of growing size, against the run in a store of 100 jobs.

job_growth.py BUILD SOURCE [JOBS...]

All jobs but one are closed. The stores are a folder and, if PGSERVICEFILE has the service
"tintgate" (scripts/with-postgres.sh), a server's database. Each run is complete: login, search
through all jobs, comparison, write-back. The sizes take turns, and each counts with its best time,
so that other load slows all of them.
"""

import contextlib
import os
import sqlite3
import subprocess
import sys
import tempfile
import time
from pathlib import Path

SIZES = (100, 10_000, 100_000, 1_000_000)
RUNS = 15
JOB = 2_000_000  # Higher than all other ids.
LIMITS = {"folder": {100_000: 1.5, 1_000_000: 6}, "server": {100_000: 1.5, 1_000_000: 8}}
KEYS = {"Input/SubType": 0, "Job/Display/Status": 211, "Remote/ShowInVerifier": 0,
        "Input/FileType": 0, "Workflow/Verify/Active": 1}


def stored(number):
    """A key of one int in the store's format, in hexadecimal."""
    return "010201000000" + number.to_bytes(4, "little").hex()


def fill_folder(path, jobs):
    """Inserts jobs directly into the database and makes the store rebuild its overview of them."""
    with contextlib.closing(sqlite3.connect(path / "tickets.db")) as database, database:
        database.execute("PRAGMA synchronous = OFF")
        numbers = f"WITH RECURSIVE n (id) AS (VALUES (1) UNION ALL SELECT id + 1 FROM n WHERE id < {jobs})"
        database.execute(f"{numbers} INSERT INTO tickets (type, id) SELECT 3, id FROM n")
        values = ", ".join(f"('{key}', x'{stored(value)}')" for key, value in KEYS.items())
        database.execute(
            f"WITH k (name, value) AS (VALUES {values}) INSERT INTO keys (ticket, name, value)"
            f" SELECT number, CAST(name AS BLOB), value FROM tickets, k"
            f" WHERE type = 3 AND id <= {jobs} ORDER BY number, name")
        database.execute("DROP TABLE job_blocks")
        database.execute("PRAGMA user_version = 1")


def psql(service, sql):
    subprocess.run(["psql", "--quiet", "--no-psqlrc", f"service={service}", "-c", sql], check=True,
                   stdout=subprocess.DEVNULL)


def fill_server(service, jobs):
    values = ", ".join(f"('{key}'::bytea, '\\x{stored(value)}'::bytea)"
                       for key, value in KEYS.items())
    psql(service, f"""
        INSERT INTO tintgate.tickets (type, id) SELECT 3, generate_series(1, {jobs});
        INSERT INTO tintgate.keys (ticket, name, value, change) SELECT number, name, value, 0
            FROM tintgate.tickets, (VALUES {values}) AS k (name, value)
            WHERE type = 3 AND id <= {jobs};
        DROP TABLE tintgate.job_blocks; ALTER TABLE tintgate.files DROP last_version;
        UPDATE tintgate.store SET format = 2""")
    psql(service, "ANALYZE")


def run(command, environment):
    """Processor seconds and elapsed seconds."""
    start = time.perf_counter()
    child = os.posix_spawn(command[0], command, environment)
    _, status, usage = os.wait4(child, 0)
    if os.waitstatus_to_exitcode(status) != 0:
        sys.exit(f"{' '.join(command)}: exit code {os.waitstatus_to_exitcode(status)}")
    return usage.ru_utime + usage.ru_stime, time.perf_counter() - start


class Bench:
    def __init__(self, build, source, folder):
        self.tool, self.store = f"{build}/bin/Tintgate", f"{build}/bin/tintgate-store"
        self.folder = folder
        subprocess.run([sys.executable, f"{source}/docs/example-job/make-job.py", folder / "job",
                        "--job", str(JOB)], check=True, stdout=subprocess.DEVNULL)
        subprocess.run(["cmake", "--install", build, "--component", "companions", "--prefix",
                        folder / "root"], check=True, stdout=subprocess.DEVNULL)
        viewer = folder / "root/Applications/Nerova/Nerova Verify.app/Contents/MacOS/Nerova Verify"
        viewer.unlink()  # It would run in parallel and disturb the times.
        viewer.symlink_to("/bin/true")
        (folder / "tmp").mkdir()
        self.environment = {"TINTGATE_ROOT": str(folder / "root"), "TMPDIR": str(folder / "tmp"),
                            "PATH": "/usr/bin:/bin"}

    def admin(self, address, *words):
        subprocess.run([self.store, "--store", address, *words], input=b"secret\n", check=True,
                       stdout=subprocess.DEVNULL)

    def make(self, address, fill):
        self.admin(address, "make")
        self.admin(address, "user", "add", "anna", "--password-file", "-")
        fill()
        self.admin(address, "upgrade")
        self.admin(address, "import", str(self.folder / "job/tickets.json"))
        self.admin(address, "file", "put", str(self.folder / "job/server"), "/server")

    def measure(self, place, addresses):
        """Prints the times of the stores by number of jobs. False if one takes too long."""
        best = {jobs: (1e9, 1e9) for jobs in addresses}
        for _ in range(RUNS):
            for jobs, address in addresses.items():
                taken = run([self.tool, f"KEY_KZ_HOST:=:{address}", "0", str(JOB), "en_US", "0",
                             "secret", "anna"], self.environment)
                best[jobs] = tuple(map(min, best[jobs], taken))
        kept = True
        for jobs, (processor, clock) in best.items():
            # The program's processor time does not include the server's work.
            which = 0 if place == "folder" else 1
            ratio = best[jobs][which] / best[min(best)][which]
            limit = LIMITS[place].get(jobs)
            missed = limit is not None and ratio > limit
            kept = kept and not missed
            print(f"{place}, {jobs:>9,} jobs: {clock * 1e3:6.1f} ms on the clock, "
                  f"{processor * 1e3:6.1f} ms of the processor, {ratio:.2f} times the smallest"
                  + (f" (at most {limit}){'  MISSED' if missed else ''}" if limit else ""),
                  flush=True)
        return kept


def main(build, source, *sizes):
    sizes = [int(size) for size in sizes] or SIZES
    kept = True
    with tempfile.TemporaryDirectory() as name:
        folder = Path(name)
        bench = Bench(build, source, folder)
        addresses = {jobs: str(folder / f"store{jobs}") for jobs in sizes}
        for jobs, address in addresses.items():
            bench.make(address, lambda: fill_folder(Path(address), jobs))
        kept = bench.measure("folder", addresses) and kept
        if os.environ.get("PGSERVICEFILE"):
            services = Path(os.environ["PGSERVICEFILE"]).read_text(encoding="utf-8")
            lines = services[services.index("\n"):]
            with open(folder / "services", "w", encoding="utf-8") as file:
                file.write(services)
                for jobs in sizes:
                    file.write(f"[jobs{jobs}]\ndbname=jobs{jobs}{lines}\n")
            os.environ["PGSERVICEFILE"] = str(folder / "services")
            bench.environment["PGSERVICEFILE"] = str(folder / "services")
            for jobs in sizes:
                psql("tintgate", f"CREATE DATABASE jobs{jobs}")
                bench.make(f"jobs{jobs}", lambda: fill_server(f"jobs{jobs}", jobs))
            kept = bench.measure("server", {jobs: f"jobs{jobs}" for jobs in sizes}) and kept
    return 0 if kept else 1


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
