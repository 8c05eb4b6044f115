#!/bin/sh
# The library never prints, ends the process, reads the environment or installs a signal handler:
# none of the functions that do is among the symbols it takes from elsewhere. One object may ask the environment where
# records of registration lie: the one behind DllRegisterServer and DllUnregisterServer.
#   manners.sh LIBRARY OBJECT...
set -eu
library=$1
shift

undefined=$(nm -D --undefined-only "$library" | awk '{print $NF}' | sed 's/@.*//' | sort -u)
[ -n "$undefined" ] || { echo "manners: no symbols read from $library" >&2; exit 1; }

forbidden='abort exit _exit _Exit quick_exit __assert_fail raise kill system popen
getenv __secure_getenv setenv putenv environ __environ
signal sigaction __sysv_signal bsd_signal sigprocmask pthread_sigmask
printf vprintf puts putchar fprintf vfprintf fputs fputc putc perror psignal dprintf syslog
__printf_chk __vprintf_chk __fprintf_chk __vfprintf_chk stdout stderr
_ZSt4cout _ZSt4cerr _ZSt4clog _ZSt5wcout _ZSt5wcerr _ZSt5wclog setlocale'

found=$(for name in $forbidden; do echo "$undefined" | grep -Fx -- "$name" || true; done)
if [ -n "$found" ]; then
    echo "manners: $library calls or uses:" $found >&2
    exit 1
fi

readers=$(nm -A --undefined-only "$@" | awk '$NF ~ /^secure_getenv(@|$)/ {sub(/:.*/, "", $1); print $1}' | sort -u)
case $readers in
*/zelt_host.dir/*/module_record.cpp.o) ;;
*)
    echo "manners: only module_record.cpp may read the environment, not:" $readers >&2
    exit 1
    ;;
esac
echo "manners: none of the forbidden names among $(echo "$undefined" | wc -l) undefined symbols"
