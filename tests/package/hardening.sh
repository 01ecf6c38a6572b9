#!/bin/sh
# Fails unless the libraries are hardened: hardening.sh SOURCE-FOLDER COMPILE-COMMANDS [SHARED-LIBRARY]...
#
# What leaves a trace in a shared library is read from it; what leaves none, from the commands that compiled its sources.
set -eu
source=$1
commands=$2
shift 2
status=0
complain() {
    echo "$1" >&2
    status=1
}

[ -f "$commands" ] || { echo "no file $commands" >&2; exit 1; }
compiled=$(python3 - "$source" "$commands" <<'END'
import json
import pathlib
import sys

source = pathlib.Path(sys.argv[1]).resolve()
libraries = [source / "src", source / "platform" / "ZQ" / "src", source / "platform" / "VXLog" / "src"]
for entry in json.loads(pathlib.Path(sys.argv[2]).read_text(encoding="utf-8")):
    file = pathlib.Path(entry["file"]).resolve()
    if "ICTesting" not in entry["command"] and any(library in file.parents for library in libraries):
        print(entry["command"])
END
)
[ -n "$compiled" ] || { echo "no source of a library in $commands" >&2; exit 1; }
without() {
    echo "$compiled" | grep -v -e "$1" | sed 's/.* -c /  /' || true
}
for option in -fstack-protector-strong -fstack-clash-protection; do
    lacking=$(without "$option")
    [ -z "$lacking" ] || complain "compiled without $option: $lacking"
done
lacking=$(without '-D_FORTIFY_SOURCE=2' | grep . || true)
if echo "$compiled" | grep -q -e ' -O[23s]'; then
    [ -z "$lacking" ] || complain "optimised without _FORTIFY_SOURCE: $lacking"
fi

for library; do
    [ -f "$library" ] || { echo "no library $library" >&2; exit 1; }
    dynamic=$(readelf --dynamic --wide "$library")
    segments=$(readelf --program-headers --wide "$library")
    symbols=$(readelf --dyn-syms --wide "$library")

    echo "$segments" | grep -q GNU_RELRO || complain "$library: no relocation is made read-only (-z relro)"
    echo "$dynamic" | grep -q 'FLAGS_1.* NOW' || complain "$library: symbols are bound lazily (-z now)"
    echo "$segments" | grep -q 'GNU_STACK.* RW ' || complain "$library: the stack is executable (-z noexecstack)"
    echo "$symbols" | grep -q __stack_chk_fail || complain "$library: the stack is not protected"

    # A sanitizer puts its own code before a function, and its run-time library is linked to the program alone.
    ! echo "$symbols" | grep -qE '__(asan|tsan|ubsan)_' || continue

    undefined=$(ldd -r "$library" 2>&1 | grep 'undefined symbol' || true)
    [ -z "$undefined" ] || complain "$library: not linked with all that it needs (-z defs): $undefined"

    [ "$(uname -m)" = x86_64 ] || continue
    functions=$(echo "$symbols" | awk '$4 == "FUNC" && $7 != "UND" { sub(/^0+/, "", $2); print $2 }' | sort -u)
    landings=$(objdump --disassemble --no-show-raw-insn "$library" |
        awk '$2 == "endbr64" { sub(":", "", $1); print $1 }' | sort -u)
    [ -n "$functions" ] || complain "$library: exports no function"
    open=$(printf '%s\n' "$landings" "$landings" "$functions" | sort | uniq -u)
    [ -z "$open" ] || complain "$library: functions without -fcf-protection at: $open"
done
exit $status
