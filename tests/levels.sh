#!/bin/sh
# Objects built for an instruction-set level define names of that level's namespace only. Any other name with
# shared linkage could be taken by the linker for the whole program, which then runs that level's
# instructions on processors that lack them.
#   levels.sh LEVEL OBJECT...
set -eu
level=$1
shift
[ $# -gt 0 ] || { echo "levels: no objects for $level" >&2; exit 1; }
namespace="N[VK]*3Qor5Luxar4ZELT${#level}$level"

status=0
count=0
for object in "$@"; do
    names=$(nm --defined-only "$object" | awk '{print $NF}')
    # GCC's tables for switches and its constants are local to the object and hold data only.
    stray=$(echo "$names" | grep -Ev "^_Z(Z|T[VISTC]|GV|GR)*$namespace" |
        grep -Ev '^(DW\.ref\.|CSWTCH\.|C\.[0-9]|\.LC)' || true)
    if [ -n "$stray" ]; then
        echo "levels: $object defines outside namespace Qor::Luxar::ZELT::$level:" >&2
        echo "$stray" | c++filt >&2
        status=1
    fi
    count=$((count + $(echo "$names" | wc -l)))
done
[ $status -ne 0 ] || echo "levels: $count names in $# objects of $level, all inside its namespace"
exit $status
