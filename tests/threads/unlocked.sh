#!/bin/sh
# Checks that clang accepts src/Node.cpp and rejects it without its locks: unlocked.sh NODE.CPP COMPILER ARGUMENT...
set -eu
source=$1
shift
[ -f "$source" ] || { echo "no file $source" >&2; exit 1; }
"$@" -x c++ -fsyntax-only "$source" || { echo "$source does not compile" >&2; exit 1; }
messages=$(sed '/const Lock lock(mutex);/d' "$source" | "$@" -x c++ -fsyntax-only - 2>&1) &&
    { echo "$source compiles without its locks" >&2; exit 1; }
for member in status description properties; do
    echo "$messages" | grep -q "variable '$member' requires holding mutex" ||
        { echo "clang did not report '$member':" "$messages" >&2; exit 1; }
done
