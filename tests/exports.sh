#!/bin/sh
# What the library exports is decided, never accidental: only names of Qor and the four module entry points,
# and exactly those listed in exports.txt. After a deliberate change: exports.sh LIBRARY --update
#   exports.sh LIBRARY [--update]
set -eu
library=$1
list=$(dirname "$0")/exports.txt
LC_ALL=C
export LC_ALL

names=$(nm -D --defined-only "$library" | awk '{print $NF}' | sed 's/@.*//' | sort -u)
[ -n "$names" ] || { echo "exports: $library exports nothing" >&2; exit 1; }

# Mangled names: functions, objects and operators of Qor; their vtables, type information, thunks and guards.
foreign=$(echo "$names" | grep -Ev '^_Z(Z|T[VISTC]|Th[n0-9_]+|Tv[n0-9_]+|Tc[hvn0-9_]+|GV|GR)*N?[rVK]*[RO]?3Qor' |
    grep -Ev '^Dll(GetClassObject|CanUnloadNow|RegisterServer|UnregisterServer)$' || true)
if [ -n "$foreign" ]; then
    echo "exports: names outside Qor:" >&2
    echo "$foreign" | c++filt >&2
    exit 1
fi

present=$(echo "$names" | c++filt | sort -u)
if [ "${2:-}" = --update ]; then
    echo "$present" >"$list"
    echo "exports: $(echo "$present" | wc -l) names written to $list"
    exit 0
fi
if ! echo "$present" | diff -u "$list" - >&2; then
    echo "exports: differs from $list; if that is meant: $0 $library --update" >&2
    exit 1
fi
echo "exports: $(echo "$present" | wc -l) names, as listed"
