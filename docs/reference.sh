#!/bin/sh
# Writes a reference page for each facet, from what the library says of itself: docs/reference.sh ZELT FOLDER
set -eu
[ $# -eq 2 ] || { sed -n 2p "$0"; exit 2; }
zelt=$1
folder=$2
mkdir -p "$folder"
"$zelt" list | sed -n 's/^\([A-Za-z]*\): .*/\1/p' | while read -r facet; do
    page=$folder/$facet.md
    "$zelt" help "$facet" | sed -n '1s/^/# /p' >"$page"
    "$zelt" list | sed -n "s/^  \($facet\.[A-Za-z_]*\) .*/\1/p" | while read -r method; do
        printf '\n## %s\n\n```\n' "${method#*.}" >>"$page"
        "$zelt" help "$method" >>"$page"
        printf '```\n' >>"$page"
    done
done
echo "reference pages: $folder"
