#!/bin/sh
# Writes utf7-<sample>.xml beside every entity-doubling.xml and
# nested-content-model.xml here: the same document, declaring UTF-7, with
# everything after its XML declaration re-encoded in UTF-7, so that no '<'
# of the DTD is left in its bytes ("<!DOCTYPE" becomes "+ADwAIQ-DOCTYPE").
set -e
cd "$(dirname "$0")"
for dir in */; do
    for sample in entity-doubling nested-content-model; do
        [ -f "$dir$sample.xml" ] || continue
        {
            printf '<?xml version="1.0" encoding="UTF-7"?>\n'
            sed 1d "$dir$sample.xml" | iconv -f UTF-8 -t UTF-7
        } > "${dir}utf7-$sample.xml"
    done
done
