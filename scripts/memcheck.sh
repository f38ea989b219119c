#!/bin/sh
# SPDX-License-Identifier: Apache-2.0
# Runs the tests of the ticket library and its engine under valgrind, with leak checks. Needs a
# release build (scripts/test.sh makes one) and Debian's package valgrind.
set -eu
cd "$(dirname "$0")/.."

for test in ticket_test TicketEngineTest; do
  echo "memcheck: $test"
  # Thousands of random edits would take minutes under valgrind and cover no additional code.
  valgrind --quiet --error-exitcode=1 --leak-check=full --show-leak-kinds=definite,indirect,possible \
    --errors-for-leak-kinds=definite,indirect,possible --suppressions=tests/valgrind.supp \
    "build/release/bin/$test" --gtest_brief=1 --gtest_filter='-FlushRandom*'
done
