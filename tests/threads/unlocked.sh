#!/bin/sh
# Fails unless clang refuses src/Node.cpp where its locks are left out: unlocked.sh NODE.CPP COMPILER ARGUMENT...
set -eu
source=$1
shift
[ -f "$source" ] || { echo "no file $source" >&2; exit 1; }
"$@" -x c++ -fsyntax-only "$source" || { echo "refused with its locks" >&2; exit 1; }
messages=$(sed '/const Lock lock(mutex);/d' "$source" | "$@" -x c++ -fsyntax-only - 2>&1) && { echo "not refused" >&2; exit 1; }
for member in status description properties; do
    echo "$messages" | grep -q "variable '$member' requires holding mutex" ||
        { echo "$member is not guarded:" "$messages" >&2; exit 1; }
done
