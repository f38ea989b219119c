# SPDX-License-Identifier: Apache-2.0
# docs/exit-codes.csv is the single source of exit codes, and docs/job-outcomes.csv of what they
# require of whom in a job. "ExitCodes.h" is generated from both.

find_package(Python3 REQUIRED COMPONENTS Interpreter)

set(_codes "${PROJECT_SOURCE_DIR}/docs/exit-codes.csv")
set(_outcomes "${PROJECT_SOURCE_DIR}/docs/job-outcomes.csv")
set(_maker "${PROJECT_SOURCE_DIR}/scripts/make-exit-codes.py")
set(_tables "${PROJECT_SOURCE_DIR}/scripts/tables.py")
set(_header "${PROJECT_BINARY_DIR}/see/exitcodes/ExitCodes.h")

file(MAKE_DIRECTORY "${PROJECT_BINARY_DIR}/see/exitcodes")
add_custom_command(OUTPUT "${_header}"
  COMMAND Python3::Interpreter "${_maker}" header "${_codes}" "${_header}"
  DEPENDS "${_codes}" "${_outcomes}" "${_maker}" "${_tables}"
  COMMENT "Making ExitCodes.h from docs/exit-codes.csv" VERBATIM)
add_custom_target(exitcodes_header DEPENDS "${_header}")

add_library(exitcodes INTERFACE)
target_include_directories(exitcodes INTERFACE "${PROJECT_BINARY_DIR}/see/exitcodes")
add_dependencies(exitcodes exitcodes_header)

# docs/companion-statuses.csv is the source for the companion programs.
set(_statuses "${PROJECT_SOURCE_DIR}/docs/companion-statuses.csv")
set(_maker "${PROJECT_SOURCE_DIR}/scripts/make-companion-statuses.py")
set(_header "${PROJECT_BINARY_DIR}/see/statuses/CompanionStatuses.h")

file(MAKE_DIRECTORY "${PROJECT_BINARY_DIR}/see/statuses")
add_custom_command(OUTPUT "${_header}"
  COMMAND Python3::Interpreter "${_maker}" header "${_statuses}" "${_header}"
  DEPENDS "${_statuses}" "${_maker}" "${_tables}"
  COMMENT "Making CompanionStatuses.h from docs/companion-statuses.csv" VERBATIM)
add_custom_target(statuses_header DEPENDS "${_header}")

add_library(statuses INTERFACE)
target_include_directories(statuses INTERFACE "${PROJECT_BINARY_DIR}/see/statuses")
add_dependencies(statuses statuses_header)
