#!/bin/sh
# Prints how large the tests are beside the code they test: non-blank lines of
# .cpp and .h files under tests/ against those everywhere else (build folders
# and .git left out).
#
#   scripts/test-ratio.sh [MAX_PERCENT]
#
# With MAX_PERCENT it exits 1 when the tests are above that share.
set -e
cd "$(dirname "$0")/.."

sources() {
    if git rev-parse --is-inside-work-tree >/dev/null 2>&1; then
        git ls-files --cached --others --exclude-standard -- '*.cpp' '*.h'
    else
        find . -path ./.git -prune -o -path './build*' -prune -o \
            -type f \( -name '*.cpp' -o -name '*.h' \) -print | sed 's|^\./||'
    fi
}

count() {
    # Files that are listed but gone (deleted, not yet committed) count nothing.
    while read -r f; do [ -f "$f" ] && printf '%s\0' "$f"; done | xargs -0 -r cat | grep -c '[^[:space:]]' || true
}

tests=$(sources | grep '^tests/' | count)
rest=$(sources | grep -v '^tests/' | count)
percent=$(( tests * 100 / (rest > 0 ? rest : 1) ))
echo "test-ratio: tests/ holds $tests non-blank C++ lines, the rest $rest: $percent %"

if [ -n "$1" ] && [ "$percent" -gt "$1" ]; then
    echo "test-ratio: above $1 %: fold or drop tests that guard no real fault" >&2
    exit 1
fi
