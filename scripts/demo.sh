#!/bin/sh
# Runs Corvid on the bundled sample project, in a copy under the build tree:
# builds the usage report with corvid-report, then opens the sample's usage
# file in orb, which hands it to the Corvid plug-in.
set -e

BUILD_DIR=${1:-build}
STAGE="$(cd "$BUILD_DIR" && pwd)/stage"
SRC="$(cd "$(dirname "$0")/.." && pwd)"
DEMO="$(cd "$BUILD_DIR" && pwd)/demo"

rm -rf "$DEMO"
mkdir -p "$DEMO/home"
cp -R "$SRC/examples/ledctrl" "$DEMO/ledctrl"
# The sample's repository (beside the project file) with its creation date.
"$STAGE/bin/orb" new-project "$DEMO/ledctrl/ledctrl.orb"

# A private home: the demo neither reads nor changes the user's own settings.
export HOME="$DEMO/home"
export XDG_CONFIG_HOME="$HOME/.config" XDG_DATA_HOME="$HOME/.local/share"
export XDG_RUNTIME_DIR="$DEMO/run"
mkdir -p -m 700 "$XDG_RUNTIME_DIR"
export QT_QPA_PLATFORM="${QT_QPA_PLATFORM:-offscreen}"

# The help viewer's usage file lives in the user's data location.
VERSION=$(sed -n 's/^version=//p' "$STAGE/data/orb_version" | head -n 1 | cut -c1-4)
HELPDIR="$XDG_DATA_HOME/Vantor/Common/$VERSION"
mkdir -p "$HELPDIR"
cp "$SRC/examples/helpviewer/orbhelpviewerdata.xml" "$HELPDIR/"

echo "== corvid-report: what would be sent"
"$STAGE/bin/corvid-report" --project "$DEMO/ledctrl/ledctrl.orb" "$DEMO/ledctrl/ledctrl_usage.xml"

echo "== orb open: the usage file reaches the Corvid plug-in"
ORB_DEBUG=1 "$STAGE/bin/orb" --project "$DEMO/ledctrl/ledctrl.orb" open "$DEMO/ledctrl/ledctrl_usage.xml"

echo "== the page: $DEMO/ledctrl/device_usage_statistics.html"
