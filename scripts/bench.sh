#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Times the parts and the whole program against their peers. Takes about five minutes on an idle
# machine.
set -euo pipefail
cd "$(dirname "$0")/.."

scripts/setup.sh
cmake --preset release >/dev/null

# Each prints a ratio against a peer or a bare loop timed in the same run.
benches=(colour_cgats_bench colour_cxf_bench colour_difference_bench ticket_list_bench ticket_flush_bench jdf_bench
  store_bench measure_bench job_bench)
cmake --build --preset release --target Tintgate empty_wx store_postgres_bench "${benches[@]}"
for bench in "${benches[@]}"; do
  echo "== $bench"
  "build/release/bin/$bench"
done
echo "== store_postgres_bench"
scripts/with-postgres.sh build/release/bin/store_postgres_bench
echo "== the whole program"
cmake --build --preset release --target bench_tool
echo "== many files"
cmake --build --preset release --target bench_check
echo "== a whole run of the job form"
cmake --build --preset release --target bench_job
echo "== runs in stores of growing size"
scripts/with-postgres.sh python3 bench/store/job_growth.py "$PWD/build/release" "$PWD"
echo "== the pages of reports"
cmake --build --preset release --target bench_report
