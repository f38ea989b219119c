#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Gives a command a PostgreSQL server of its own:
#
#   with-postgres.sh COMMAND ARGUMENT...     starts a server, runs the command, stops the server
#   with-postgres.sh start FOLDER            starts a new one that stays
#   with-postgres.sh stop FOLDER [MODE]      stops it (fast, or immediate as a crash would) ...
#   with-postgres.sh again FOLDER            ... and starts it again with what it holds
#   with-postgres.sh remove FOLDER           stops it, and removes all it held
#
# The server listens on a Unix socket in its folder and nowhere else. PGSERVICEFILE, which the
# command finds set, is FOLDER/pg_service.conf, with the service "tintgate".
#
# PostgreSQL refuses to run as root: root's server runs as the user postgres, which Debian's package
# brings. PG_OPTIONS is handed to the server, such as "-c fsync=off".
set -euo pipefail

binaries=$(ls -d /usr/lib/postgresql/*/bin 2>/dev/null | sort -V | tail -1)
if [ -z "$binaries" ]; then
  echo "with-postgres.sh: Debian's package postgresql is not installed" >&2
  exit 1
fi

as_server() {
  if [ "$(id -u)" -eq 0 ]; then
    (cd / && setpriv --reuid=postgres --regid=postgres --clear-groups "$@")
  else
    "$@"
  fi
}

control() {
  as_server "$binaries/pg_ctl" --pgdata="$folder/data" --silent --timeout=60 "$@" \
    >>"$folder/control.log" 2>&1 || {
    cat "$folder/control.log" "$folder/server.log" >&2
    return 1
  }
}

again() {
  control start --log="$folder/server.log" \
    --options="-c listen_addresses='' -c unix_socket_directories='$folder' ${PG_OPTIONS:-}"
}

remove() {
  if [ -f "$folder/data/PG_VERSION" ]; then
    control stop --mode=immediate 2>/dev/null || true # It may have been stopped.
    rm -rf "$folder"
  fi
}

start() {
  remove # What was left by a run that was cut off.
  mkdir -p "$folder"
  chmod 0700 "$folder"
  if [ "$(id -u)" -eq 0 ]; then
    chown postgres "$folder"
  fi
  printf '[tintgate]\nhost=%s\ndbname=postgres\nuser=tintgate\n' "$folder" >"$folder/pg_service.conf"
  as_server "$binaries/initdb" --pgdata="$folder/data" --username=tintgate --auth=trust \
    --encoding=UTF8 --locale=C --no-sync >"$folder/initdb.log" 2>&1 || {
    cat "$folder/initdb.log" >&2
    return 1
  }
  : >"$folder/control.log"
  again
}

case ${1:-} in
start | again | stop | remove)
  if [ $# -lt 2 ]; then
    echo "with-postgres.sh: $1 which folder?" >&2
    exit 64
  fi
  folder=$(realpath -m "$2")
  if [ "$1" = stop ]; then
    control stop --mode="${3:-fast}"
  else
    "$1"
  fi
  ;;
"")
  sed -n '2,/^set/s/^# \{0,1\}//p' "$0" >&2
  exit 64
  ;;
*)
  # A socket has a path of at most 107 bytes, and its folder must be in reach of that user.
  folder=$(mktemp -d /tmp/tintgate-postgres.XXXXXX)
  trap remove EXIT
  start
  PGSERVICEFILE="$folder/pg_service.conf" "$@"
  ;;
esac
