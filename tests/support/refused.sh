#!/bin/sh
# Checks that SOURCE compiles without its lines that say "does not compile: WORDS". With any one of these, the compiler
# has to report an error with these words, in that line or in what that line instantiates from a header:
# refused.sh SOURCE COMPILER ARGUMENT...
set -eu
LC_ALL=C
export LC_ALL
source=$1
shift
lines=$(grep -n '// does not compile: ' "$source" | cut -d: -f1)

# with LINE COMPILER ARGUMENT...: compiles SOURCE with that one line, or with none of them if LINE is 0.
with() {
    line=$1
    shift
    awk -v line="$line" '/\/\/ does not compile: / && NR != line { $0 = "" } { print }' "$source" |
        "$@" -x c++ -fsyntax-only - 2>&1
}

# names LINE WORDS: whether the messages name the line and, in an error, the words.
names() {
    if echo "$messages" | grep -q "<stdin>:$1:.*\(required from here\|requested here\)"; then
        echo "$messages" | grep 'error: ' | grep -qF "$2"
    else
        echo "$messages" | grep "<stdin>:$1:.*error: " | grep -qF "$2"
    fi
}

[ -n "$lines" ] || { echo "$source: no line says 'does not compile'" >&2; exit 1; }
messages=$(with 0 "$@") ||
    { printf '%s: does not compile without these lines\n%s\n' "$source" "$messages" >&2; exit 1; }
for line in $lines; do
    messages=$(with "$line" "$@") && { echo "$source:$line: compiles" >&2; exit 1; }
    words=$(sed -n "${line}s/.*does not compile: //p" "$source")
    names "$line" "$words" ||
        { printf '%s:%s: no error says "%s"\n%s\n' "$source" "$line" "$words" "$messages" >&2; exit 1; }
done
