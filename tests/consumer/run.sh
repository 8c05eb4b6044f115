#!/bin/sh
# Installs a build into a folder of its own, then builds and runs a client against it in both ways that are
# promised: find_package(zelt) and pkg-config.
#   run.sh CMAKE BUILD_FOLDER CXX STAGE_FOLDER
set -eu
cmake=$1 build=$2 cxx=$3 stage=$4
here=$(cd "$(dirname "$0")" && pwd)

rm -rf "$stage"
"$cmake" --install "$build" --prefix "$stage/usr" >/dev/null
# A client must find the headers in the installed tree alone, also after that tree was moved.
mv "$stage/usr" "$stage/moved"

"$cmake" -S "$here" -B "$stage/find_package" -DCMAKE_PREFIX_PATH="$stage/moved" -DCMAKE_CXX_COMPILER="$cxx" \
    -DCMAKE_BUILD_TYPE=Release >/dev/null
"$cmake" --build "$stage/find_package" >/dev/null
"$stage/find_package/consumer"
echo "consumer: find_package(zelt) works"

pc=$(dirname "$(find "$stage/moved" -name zelt.pc)")
export PKG_CONFIG_PATH="$pc"
libdir=$(pkg-config --variable=libdir zelt)
"$cxx" -std=c++20 "$here/main.cpp" -o "$stage/consumer" $(pkg-config --cflags --libs zelt)
LD_LIBRARY_PATH="$libdir" "$stage/consumer"
echo "consumer: pkg-config zelt works"
