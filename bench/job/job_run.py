#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Times a whole run of the job form against the comparison of the same two files.

job_run.py BUILD SOURCE

The job has 1,617 stored patches (FOGRA40L), each with 36 spectral values, and is compared with a
file of characterization data (FOGRA39L). The login and the pause of a third of its time are
excluded: a run whose job is not on the server's list ends right after the login, so its time beyond
that of `-version` is the login. Nearly all of that would be the hash of the password, which takes
ten times as long as the measured work and varies with the machine's load. So the store uses the
cheapest possible password hash. The sides take turns, and the medians of processor time are
compared; elapsed time is printed too.
"""

import contextlib
import ctypes
import ctypes.util
import json
import os
import sqlite3
import statistics
import subprocess
import sys
import tempfile
import time
from pathlib import Path

ICC = Path("/usr/share/color/icc")
REFERENCES, MEASURED = ICC / "FOGRA39L.ti3", ICC / "FOGRA40L.ti3"
RUNS = 61
PASSWORD = b"gate"
LIMIT = 3.0
BANDS = 36


def timed(command, environment, expected):
    """Processor seconds and elapsed seconds of one run."""
    start = time.perf_counter()
    child = os.posix_spawn(command[0], command, environment)
    _, status, usage = os.wait4(child, 0)
    seconds = time.perf_counter() - start
    code = os.waitstatus_to_exitcode(status)
    if code != expected:
        sys.exit(f"{' '.join(command)}: exit code {code}")
    return usage.ru_utime + usage.ru_stime, seconds


def whole_chart():
    """Device values and the six colour values of each row of the measured chart."""
    lines = MEASURED.read_text(encoding="latin-1").splitlines()
    fields = lines[lines.index("BEGIN_DATA_FORMAT") + 1].split()
    rows = []
    for line in lines[lines.index("BEGIN_DATA") + 1:]:
        if line.startswith("END_DATA"):
            return rows
        row = dict(zip(fields, line.split()))
        rows.append({name: float(row[name]) for name in
                     [f"CMYK_{ink}" for ink in "CMYK"] + ["XYZ_X", "XYZ_Y", "XYZ_Z"] +
                     ["LAB_L", "LAB_A", "LAB_B"]})
    return rows


def fill_store(store, folder, source):
    """The example job, with the whole chart as its measurement."""
    subprocess.run([sys.executable, f"{source}/docs/example-job/make-job.py", folder / "job",
                    "--unmeasured"], check=True, stdout=subprocess.DEVNULL)
    tickets = json.loads((folder / "job/tickets.json").read_text(encoding="ascii"))
    keys = next(ticket["keys"] for ticket in tickets["tickets"] if ticket["type"] == 3)
    rows, root = whole_chart(), "Remote/Measurement"
    for name, value in {"Status": 1, "Numpatches": len(rows), "SpectralValues/Base": 380,
                        "SpectralValues/Length": BANDS, "SpectralValues/Stepsize": 10}.items():
        keys[f"{root}/{name}"] = {"int": value}
    for group, field, axes in (("CMYKValues", "CMYK", "CMYK"), ("XYZValues", "XYZ", "XYZ"),
                               ("LabValues", "LAB", "LAB")):
        for axis in axes:
            keys[f"{root}/{group}/{axis}Values"] = {
                "double": [row[f"{field}_{axis}"] for row in rows]}
    # Spectra of grey patches: their values are written and read but not evaluated.
    keys[f"{root}/SpectralValues/DValues"] = {
        "double": [row["XYZ_Y"] / 100 + band / 1e4 for row in rows for band in range(BANDS)]}
    (folder / "job/tickets.json").write_text(json.dumps(tickets), encoding="ascii")
    for words in (["make"], ["user", "add", "anna", "--password-file", "-"],
                  ["import", folder / "job/tickets.json"],
                  ["file", "put", folder / "job/server", "/server"]):
        subprocess.run([*store, *words], input=PASSWORD + b"\n", check=True,
                       stdout=subprocess.DEVNULL)


def make_login_cheap(tickets):
    """Replaces the password's hash by one with the least memory and work that is allowed."""
    sodium = ctypes.CDLL(ctypes.util.find_library("sodium"))
    text = ctypes.create_string_buffer(sodium.crypto_pwhash_strbytes())
    if sodium.sodium_init() < 0 or sodium.crypto_pwhash_str(
            text, PASSWORD, ctypes.c_ulonglong(len(PASSWORD)), ctypes.c_ulonglong(1),
            ctypes.c_size_t(8192)) != 0:
        sys.exit("no cheap hash of the password")
    with contextlib.closing(sqlite3.connect(tickets)) as database, database:
        database.execute("UPDATE users SET hash = ?", (text.value,))


def main(build, source):
    with tempfile.TemporaryDirectory() as name:
        folder = Path(name)
        fill_store([f"{build}/bin/tintgate-store", "--store", folder / "store"], folder, source)
        make_login_cheap(folder / "store/tickets.db")
        subprocess.run(["cmake", "--install", build, "--component", "companions", "--prefix",
                        folder / "root"], check=True, stdout=subprocess.DEVNULL)
        # No viewer: it would run in parallel and disturb the times.
        viewer = folder / "root/Applications/Nerova/Nerova Verify.app/Contents/MacOS/Nerova Verify"
        viewer.unlink()
        viewer.symlink_to("/bin/true")
        (folder / "tmp").mkdir()
        environment = {"TINTGATE_ROOT": str(folder / "root"), "TMPDIR": str(folder / "tmp"),
                       "PATH": "/usr/bin:/bin"}
        tool = f"{build}/bin/Tintgate"

        def job(number):
            return [tool, f"KEY_KZ_HOST:=:{folder / 'store'}", "0", str(number), "en_US", "0",
                    PASSWORD.decode(), "anna"]

        files = folder / "tmp/Tintgate/JobID_7"
        sides = {"job": (job(7), 0), "login": (job(999), 108), "nothing": ([tool, "-version"], 0),
                 "files": ([tool, str(files / REFERENCES.name), str(files / "Measured sample.txt"),
                            str(files / "CVP_0001.xml"), str(folder / "result.json")], 0)}
        os.dup2(os.open("/dev/null", os.O_WRONLY), 3)
        sys.stdout.flush()
        quiet = os.dup(1)
        os.dup2(3, 1)  # -version prints a line.
        runs = {side: [] for side in sides}
        for _ in range(RUNS):
            for side, (command, code) in sides.items():
                runs[side].append(timed(command, environment, code))
        os.dup2(quiet, 1)

    missed = False
    processor, clock = ({side: statistics.median(run[measure] for run in of) * 1e3
                         for side, of in runs.items()} for measure in (0, 1))
    for what, times, share in (("processor", processor, 1.0), ("clock", clock, 4.0 / 3.0)):
        besides = times["job"] - share * (times["login"] - times["nothing"])
        ratio = besides / times["files"]
        limit = ""
        if what == "processor":
            missed = ratio > LIMIT
            limit = f" (at most {LIMIT}){'  MISSED' if missed else ''}"
        print(f"a job against its files, {what}: {ratio:.2f}{limit}")
        print(f"  job {times['job']:.1f} ms, of which login {times['login'] - times['nothing']:.1f} "
              f"ms; files {times['files']:.1f} ms")
    return 1 if missed else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
