#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Measures what a job takes in a store: bytes on the disk, and on a server bytes of its log, for
charts of several sizes, with and without a JDF and its versions.

scripts/with-postgres.sh bench/store/job_bytes.py BUILD-FOLDER [JOBS]

Jobs have one strip: measurement and references of XYZ, Lab and CMYK, and the measurement's spectra
of 36 samples where the chart has some.
"""

import json
import os
import random
import shutil
import subprocess
import sys
import tempfile
from pathlib import Path

program = str(Path(sys.argv[1]).resolve() / "bin" / "tintgate-store")
count = int(sys.argv[2]) if len(sys.argv) > 2 else 40
folder = Path(tempfile.mkdtemp(prefix="tintgate-bytes-"))
rng = random.Random(7)


def admin(store, *words):
    return subprocess.run([program, "--store", store, *words], check=True, capture_output=True,
                          text=True).stdout


def sql(text):
    return subprocess.run(["psql", "-qtA", "service=tintgate", "--command", text], check=True,
                          capture_output=True, text=True).stdout.strip()


def ticket(job, patches, spectral):
    def doubles(number):
        return {"double": [rng.uniform(0, 100) for _ in range(number)]}
    keys = {"Input/Title": {"string": f"Job {job}"}, "Job/Display/Status": {"int": 211},
            "System/Folders/Temp": {"string": "/temp"},
            "Output/Jdf/FileName": {"string": f"{job}.jdf"}}
    groups = {"XYZValues": "XYZ", "LabValues": "LAB", "CMYKValues": "CMYK"}
    for group, letters in groups.items():
        for letter in letters:
            name = f"{group}/{letter}Values"
            keys[f"Remote/Measurement/{name}"] = doubles(patches)
            keys[f"Remote/Measurement/Reference/{name}"] = (
                {"int": [rng.randrange(256) for _ in range(patches)]} if group == "CMYKValues"
                else doubles(patches))
    if spectral:
        keys["Remote/Measurement/SpectralValues/DValues"] = doubles(36 * patches)
    for name in ("Measured", "Decimal", "Approval"):
        keys[f"Remote/Measurement/Values/{name}"] = doubles(27)
    return {"type": 3, "id": job, "keys": keys}


def fill(store, patches, spectral, jdf_bytes):
    for start in range(1, count + 1, 20):
        tickets = [ticket(job, patches, spectral) for job in range(start, min(start + 20, count + 1))]
        path = folder / "tickets.json"
        path.write_text(json.dumps({"format": "tintgate tickets", "version": 1,
                                    "tickets": tickets}))
        admin(store, "import", str(path))
    if jdf_bytes:
        files = folder / "files"
        files.mkdir(exist_ok=True)
        for _ in range(2): # Delivered, and updated once.
            for job in range(1, count + 1):
                (files / f"{job}.jdf").write_bytes(rng.randbytes(jdf_bytes // 2).hex().encode())
            admin(store, "file", "put", str(files), "/temp")
        shutil.rmtree(files)


def folder_size(path):
    return int(subprocess.run(["du", "-s", "--block-size=1", path], check=True, capture_output=True,
                              text=True).stdout.split()[0])


def in_folder(*shape):
    store = str(folder / "store")
    shutil.rmtree(store, ignore_errors=True)
    admin(store, "make")
    before = folder_size(store)
    fill(store, *shape)
    return (folder_size(store) - before) / count, None


def on_server(*shape):
    sql("SET client_min_messages = error; DROP SCHEMA IF EXISTS tintgate CASCADE")
    admin("tintgate", "make")
    sql("CHECKPOINT")
    before = int(sql("SELECT pg_database_size(current_database())"))
    log = sql("SELECT pg_current_wal_insert_lsn()")
    fill("tintgate", *shape)
    after = int(sql("SELECT pg_database_size(current_database())"))
    written = int(sql(f"SELECT pg_wal_lsn_diff(pg_current_wal_insert_lsn(), '{log}')::bigint"))
    return (after - before) / count, written / count


print(f"{'chart':34} {'place':8} {'KB of a job':>12} {'KB of log':>10}")
for name, shape in {"72 patches": (72, False, 0), "72 patches, JDF of 100 KB twice": (72, False, 100_000),
                    "72 patches, spectra": (72, True, 0), "1,617 patches": (1617, False, 0),
                    "1,617 patches, spectra": (1617, True, 0)}.items():
    for place, measure in (("folder", in_folder), ("server", on_server)):
        if place == "server" and "PGSERVICEFILE" not in os.environ:
            continue
        size, log = measure(*shape)
        shown = f"{log / 1000:10.0f}" if log is not None else f"{'-':>10}"
        print(f"{name:34} {place:8} {size / 1000:12.0f} {shown}", flush=True)
shutil.rmtree(folder)
