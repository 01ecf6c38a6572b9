#!/bin/sh
# Fails unless a compiler takes a source without the lines that say "does not compile", and refuses it with each of
# them, in that line and with the word behind the colon: refused.sh SOURCE COMPILER ARGUMENT...
set -eu
LC_ALL=C
export LC_ALL
source=$1
shift
lines=$(grep -n '// does not compile: ' "$source" | cut -d: -f1)

# with LINE COMPILER ARGUMENT...; 0 is none.
with() {
    line=$1
    shift
    awk -v line="$line" '/\/\/ does not compile: / && NR != line { $0 = "" } { print }' "$source" |
        "$@" -x c++ -fsyntax-only - 2>&1
}

[ -n "$lines" ] || { echo "$source: no line that does not compile" >&2; exit 1; }
messages=$(with 0 "$@") || { printf '%s: refused without those lines\n%s\n' "$source" "$messages" >&2; exit 1; }
for line in $lines; do
    messages=$(with "$line" "$@") && { echo "$source:$line: not refused" >&2; exit 1; }
    word=$(sed -n "${line}s/.*does not compile: //p" "$source")
    echo "$messages" | grep "<stdin>:$line:.*error: " | grep -q "$word" ||
        { printf '%s:%s: not called %s\n%s\n' "$source" "$line" "$word" "$messages" >&2; exit 1; }
done
