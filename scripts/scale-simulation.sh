#!/bin/sh
# The back end beyond one process: several corvid-ingest workers sharing one
# receiver folder and one PostgreSQL server, on this machine
# (docs/backend.md, "Scale").
#
#   sh scripts/scale-simulation.sh [BUILD_DIR] [PAGES] [WORKERS...]
#
# 1. a private PostgreSQL 15 server in a temporary folder (Unix socket only,
#    the server's default durability: fsync and synchronous commits on)
# 2. PAGES varied sample pages (default 4000) in the receiver's layout
# 3. for each worker count (default 1 2 4): a new database, then that many
#    corvid-ingest processes, each taking its share of the numbered folders
#    (--shard K/N), timed together
# 4. two workers on the same folders without shares: every page is stored
#    once, the other worker counts it as already present
# The server and the folder are removed at the end, also on failure.
set -e

BUILD_DIR=${1:-build}
PAGES=${2:-4000}
shift 2 2>/dev/null || shift $#
WORKERS=${*:-1 2 4}
BIN="$(cd "$BUILD_DIR" && pwd)/stage/bin"
PGBIN=/usr/lib/postgresql/15/bin
[ -x "$PGBIN/initdb" ] || { echo "scale-simulation: install postgresql-15 (scripts/install-deps.sh)" >&2; exit 1; }

WORK=$(mktemp -d /tmp/corvid-scale-XXXXXX)
as_postgres() {
    if [ "$(id -u)" -eq 0 ]; then runuser -u postgres -- "$@"; else "$@"; fi
}
cleanup() {
    as_postgres "$PGBIN/pg_ctl" -D "$WORK/data" -m fast -w stop >/dev/null 2>&1 || true
    rm -rf "$WORK"
}
trap cleanup EXIT INT TERM
[ "$(id -u)" -eq 0 ] && chown postgres "$WORK"

as_postgres "$PGBIN/initdb" -D "$WORK/data" -A trust -U postgres --no-locale -E UTF8 >/dev/null
printf "listen_addresses = ''\nunix_socket_directories = '%s'\nmax_connections = 50\n" "$WORK" \
    >> "$WORK/data/postgresql.conf"
as_postgres "$PGBIN/pg_ctl" -D "$WORK/data" -l "$WORK/server.log" -w start >/dev/null
url() { echo "postgresql://postgres@/$1?host=$WORK"; }

"$BIN/corvid-ingest-bench" --generate "$WORK/received" --pages "$PAGES"
now() { date +%s.%N; }

for n in $WORKERS; do
    db=workers$n
    as_postgres "$PGBIN/createdb" -h "$WORK" -U postgres "$db"
    # The tables first, so that the workers do not race to make them.
    "$BIN/corvid-ingest" --db "$(url "$db")" "$WORK/none" >/dev/null
    start=$(now)
    k=0
    while [ $k -lt "$n" ]; do
        "$BIN/corvid-ingest" --db "$(url "$db")" --shard "$k/$n" "$WORK/received" > "$WORK/worker$k.log" &
        k=$((k + 1))
    done
    wait
    end=$(now)
    ingested=$(cat "$WORK"/worker*.log | sed -n 's/^ingested \([0-9]*\),.*/\1/p' | awk '{s += $1} END {print s}')
    awk -v n="$n" -v p="$ingested" -v s="$start" -v e="$end" \
        'BEGIN { printf "%d worker(s): %d pages in %.1f s: %.0f pages/s\n", n, p, e - s, p / (e - s) }'
    rm -f "$WORK"/worker*.log
done

echo "two workers on the same folders, no shares:"
as_postgres "$PGBIN/createdb" -h "$WORK" -U postgres same
"$BIN/corvid-ingest" --db "$(url same)" "$WORK/none" >/dev/null
"$BIN/corvid-ingest" --db "$(url same)" "$WORK/received" > "$WORK/a.log" &
"$BIN/corvid-ingest" --db "$(url same)" "$WORK/received" > "$WORK/b.log" &
wait
echo "   first:  $(tail -n 1 "$WORK/a.log")"
echo "   second: $(tail -n 1 "$WORK/b.log")"
echo "   reports stored: $("$BIN/corvid-stats" --db "$(url same)" --format csv products | awk -F, 'NR > 1 {s += $3} END {print s}')"
echo "load average: $(cat /proc/loadavg)"
