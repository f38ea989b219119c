#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Runs a command with a private PostgreSQL server:
#
#   with-postgres.sh COMMAND ARGUMENT...     starts a server, runs the command, stops the server
#   with-postgres.sh start FOLDER            starts a new one that keeps running
#   with-postgres.sh stop FOLDER [MODE]      stops it (fast, or immediate as a crash would) ...
#   with-postgres.sh again FOLDER            ... and restarts it with its data
#   with-postgres.sh remove FOLDER           stops it and removes its data
#
# The server listens only on a Unix socket in its folder. The command's PGSERVICEFILE is
# FOLDER/pg_service.conf, with the service "tintgate".
#
# PostgreSQL refuses to run as root, so root's server runs as the user postgres of Debian's package.
# PG_OPTIONS, such as "-c fsync=off", is passed to the server.
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
    control stop --mode=immediate 2>/dev/null || true  # It may be stopped already.
    rm -rf "$folder"
  fi
}

start() {
  remove  # Left over from an interrupted run.
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
    echo "with-postgres.sh: $1 needs a FOLDER" >&2
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
  # A socket's path has at most 107 bytes, and that user must have access to its folder.
  folder=$(mktemp -d /tmp/tintgate-postgres.XXXXXX)
  trap remove EXIT
  start
  PGSERVICEFILE="$folder/pg_service.conf" "$@"
  ;;
esac
