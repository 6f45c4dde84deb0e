#!/usr/bin/env bash
# A throwaway PostgreSQL cluster for the tests.
#   pg_cluster.sh start FOLDER PORT   a new cluster in FOLDER (under /tmp),
#                                     database "catalogue", superuser postgres
#   pg_cluster.sh stop FOLDER         stops it and removes FOLDER
# The server listens on a Unix socket in FOLDER only (no TCP), so PORT just
# names the socket and cannot clash with another server. Run as root, the
# server runs as the postgres user, which it insists on.
set -euo pipefail

action=${1:?start or stop}
dir=${2:?folder}
port=${3:-55432}

case "$dir" in
  /tmp/?*) ;;
  *) echo "pg_cluster: the folder must be under /tmp: $dir" >&2; exit 2 ;;
esac

bin=""
for candidate in $(ls -d /usr/lib/postgresql/*/bin 2>/dev/null | sort -V); do
  [ -x "$candidate/pg_ctl" ] && bin=$candidate
done

as_server() {
  if [ "$(id -u)" -eq 0 ]; then runuser -u postgres -- "$@"; else "$@"; fi
}

stop_cluster() {
  if [ -n "$bin" ] && [ -f "$dir/data/postmaster.pid" ]; then
    as_server "$bin/pg_ctl" -D "$dir/data" -m immediate -w stop >/dev/null 2>&1 || true
  fi
  rm -rf "$dir"
}

case "$action" in
  start)
    if [ -z "$bin" ]; then
      echo "pg_cluster: no PostgreSQL server (pg_ctl) under /usr/lib/postgresql/*/bin;" \
           "scripts/install-deps.sh installs it" >&2
      exit 1
    fi
    stop_cluster # a leftover of a run that was killed
    # Whatever fails from here leaves nothing behind.
    trap 'status=$?; if [ $status -ne 0 ]; then
            cat "$dir/server.log" >&2 2>/dev/null || true; stop_cluster; fi' EXIT
    mkdir -p "$dir"
    chmod 700 "$dir"
    if [ "$(id -u)" -eq 0 ]; then chown postgres: "$dir"; fi
    as_server "$bin/initdb" -D "$dir/data" -U postgres -A trust -E UTF8 --locale=C --no-sync \
      >"$dir/initdb.log"
    as_server "$bin/pg_ctl" -D "$dir/data" -l "$dir/server.log" -w -t 30 \
      -o "-c listen_addresses='' -c unix_socket_directories='$dir' -c port=$port -c fsync=off \
-c full_page_writes=off -c synchronous_commit=off" start >/dev/null
    as_server "$bin/createdb" -h "$dir" -p "$port" -U postgres catalogue
    echo "pg_cluster: host=$dir port=$port dbname=catalogue user=postgres"
    ;;
  stop)
    stop_cluster
    ;;
  *)
    echo "pg_cluster: start or stop, not $action" >&2
    exit 2
    ;;
esac
