#!/bin/sh
# make demo: one usage report from the bundled sample project to a receiver on
# this machine, the way it travels in use.
#
#   1. a copy of the sample project under the build tree, with its repository
#   2. a throwaway certificate authority and corvid-receiver on 127.0.0.1
#   3. an installation root whose reports/ca-cert-bundle.crt trusts that
#      authority, and CORVID_SERVER naming the receiver
#   4. orb opens the sample's usage file: the Corvid plug-in builds the page,
#      counts down five seconds and uploads it through vancurl
#   5. the page, the project's send counter and what the receiver stored
#   6. the send history: corvid-history lists the send and gives back the
#      exact bytes the receiver stored
#   7. the received page read into an SQLite database, and the reports per
#      target family it holds
#
# Everything stays under build/demo: private HOME and XDG folders, so the
# user's own settings are neither read nor changed; nothing leaves loopback.
set -e

BUILD_DIR=${1:-build}
STAGE="$(cd "$BUILD_DIR" && pwd)/stage"
SRC="$(cd "$(dirname "$0")/.." && pwd)"
DEMO="$(cd "$BUILD_DIR" && pwd)/demo"
PROJECT="$DEMO/ledctrl"
RECEIVER_PID=

stop_receiver() {
    if [ -n "$RECEIVER_PID" ]; then
        kill "$RECEIVER_PID" 2>/dev/null || true
        wait "$RECEIVER_PID" 2>/dev/null || true
        RECEIVER_PID=
    fi
}
trap stop_receiver EXIT INT TERM

rm -rf "$DEMO"
mkdir -p "$DEMO/home" "$DEMO/ca" "$DEMO/received" "$DEMO/install/data/reports"

# A private home: the demo neither reads nor changes the user's own settings.
export HOME="$DEMO/home"
export XDG_CONFIG_HOME="$HOME/.config" XDG_DATA_HOME="$HOME/.local/share" XDG_CACHE_HOME="$HOME/.cache"
export XDG_RUNTIME_DIR="$DEMO/run"
mkdir -p -m 700 "$XDG_RUNTIME_DIR"
# Offscreen unless there is a display to show the countdown on.
if [ -z "$DISPLAY" ] && [ -z "$WAYLAND_DISPLAY" ]; then
    export QT_QPA_PLATFORM="${QT_QPA_PLATFORM:-offscreen}"
fi
# Connections go straight to the receiver: no proxy from the environment, and
# "no proxy" on the host's VantorUpdate page.
unset http_proxy https_proxy HTTP_PROXY HTTPS_PROXY all_proxy ALL_PROXY
mkdir -p "$XDG_CONFIG_HOME/orb"
printf '[WebUpdate]\nProxyChoice=0\n' > "$XDG_CONFIG_HOME/orb/orb.ini"

cp -R "$SRC/examples/ledctrl" "$PROJECT"
# The sample's repository (beside the project file) with its creation date.
"$STAGE/bin/orb" new-project "$PROJECT/ledctrl.orb"

# The help viewer's usage file lives in the user's data location.
VERSION=$(sed -n 's/^version=//p' "$STAGE/data/orb_version" | head -n 1 | cut -c1-4)
HELPDIR="$XDG_DATA_HOME/Vantor/Common/$VERSION"
mkdir -p "$HELPDIR"
cp "$SRC/examples/helpviewer/orbhelpviewerdata.xml" "$HELPDIR/"

echo "== a throwaway certificate authority and the receiver's certificate"
(
    cd "$DEMO/ca"
    KEY="-newkey ec -pkeyopt ec_paramgen_curve:prime256v1 -nodes"
    openssl req -x509 $KEY -keyout ca.key -out ca.crt -days 1 -subj "/CN=Corvid demo CA" \
        -addext "basicConstraints=critical,CA:TRUE" -addext "keyUsage=critical,keyCertSign,cRLSign" 2>/dev/null
    openssl req -new $KEY -keyout server.key -out server.csr -subj "/CN=127.0.0.1" 2>/dev/null
    printf 'subjectAltName=IP:127.0.0.1,DNS:localhost\nbasicConstraints=CA:FALSE\nextendedKeyUsage=serverAuth\n' > server.ext
    openssl x509 -req -in server.csr -CA ca.crt -CAkey ca.key -set_serial 0x$(od -An -N8 -tx1 /dev/urandom | tr -d ' \n' | cut -c2-) \
        -days 1 -extfile server.ext -out server.crt 2>/dev/null
)
# The installation trusts only that authority for the upload.
cp "$DEMO/ca/ca.crt" "$DEMO/install/data/reports/ca-cert-bundle.crt"
export VANTOR="$DEMO/install"

echo "== corvid-receiver on 127.0.0.1"
"$STAGE/bin/corvid-receiver" --listen 127.0.0.1 --port 0 --data "$DEMO/received" \
    --cert "$DEMO/ca/server.crt" --key "$DEMO/ca/server.key" > "$DEMO/receiver.log" 2>&1 &
RECEIVER_PID=$!
tries=0
until grep -q '^listening on ' "$DEMO/receiver.log" 2>/dev/null; do
    tries=$((tries + 1))
    if [ $tries -gt 100 ] || ! kill -0 "$RECEIVER_PID" 2>/dev/null; then
        echo "demo: corvid-receiver did not start:" >&2
        cat "$DEMO/receiver.log" >&2
        exit 1
    fi
    sleep 0.1
done
export CORVID_SERVER="$(sed -n 's/^listening on //p' "$DEMO/receiver.log" | head -n 1)"
echo "listening on $CORVID_SERVER"
# orb runs vancurl by its name: the staged one.
export PATH="$STAGE/bin:$PATH"

echo "== corvid-report: what would be sent"
"$STAGE/bin/corvid-report" --project "$PROJECT/ledctrl.orb" "$PROJECT/ledctrl_usage.xml"

echo "== orb open: the countdown runs five seconds, then the report is uploaded"
if ! ORB_DEBUG=1 "$STAGE/bin/orb" --project "$PROJECT/ledctrl.orb" open "$PROJECT/ledctrl_usage.xml" \
        > "$DEMO/orb.log" 2>&1; then
    cat "$DEMO/orb.log" >&2
    exit 1
fi
grep -E '^Corvid' "$DEMO/orb.log" | sed 's/^/   /' || true
echo "== orb's status line"
grep -E '^orb: ' "$DEMO/orb.log" | sed 's/^/   /' || true

iteration() {
    sed -n 's/.*name="ProjectIteration">\([^<]*\)<.*/\1/p' "$1" | head -n 1
}
PAGE="$PROJECT/device_usage_statistics.html"
echo "== the page: $PAGE"
echo "   it showed send iteration $(iteration "$PAGE")"
# corvid-report shows the counter the repository holds now, without sending.
"$STAGE/bin/corvid-report" --project "$PROJECT/ledctrl.orb" --out "$DEMO/counter.html" \
    "$PROJECT/ledctrl_usage.xml" > /dev/null
echo "== the send counter in the project's repository: $(iteration "$DEMO/counter.html")"

stop_receiver
echo "== what the receiver stored ($DEMO/received)"
sed 's/^/   /' "$DEMO/receiver.log"
found=0
for folder in "$DEMO/received"/*/; do
    [ -f "$folder/@fields.txt" ] || continue
    found=1
    echo "-- $folder"
    sed 's/^/   /' "$folder/@fields.txt"
    stored="$folder$(sed -n 's/^stored_as=//p' "$folder/@fields.txt")"
    if cmp -s "$stored" "$PAGE"; then
        echo "   the stored report is the page, byte for byte"
    else
        echo "   the stored report differs from the page" >&2
        exit 1
    fi
done
if [ $found = 0 ]; then
    echo "demo: the receiver stored no report" >&2
    exit 1
fi

echo "== the send history (corvid-history list, in the demo's home)"
"$STAGE/bin/corvid-history" list | sed 's/^/   /'
ID=$("$STAGE/bin/corvid-history" list | awk 'NR == 1 { print $1 }')
if [ -n "$ID" ] && "$STAGE/bin/corvid-history" show "$ID" | cmp -s - "$stored"; then
    echo "   corvid-history show $ID gives back the bytes the receiver stored"
else
    echo "demo: the send history does not hold the report the receiver stored" >&2
    exit 1
fi
echo "   (HOME=$HOME XDG_DATA_HOME=$XDG_DATA_HOME $STAGE/bin/corvid-history list)"
echo "== corvid-ingest: the received page into the back end's database ($DEMO/corvid.sqlite)"
"$STAGE/bin/corvid-ingest" --db "sqlite:$DEMO/corvid.sqlite" "$DEMO/received"
echo "== corvid-stats families"
"$STAGE/bin/corvid-stats" --db "sqlite:$DEMO/corvid.sqlite" families
