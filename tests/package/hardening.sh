#!/bin/sh
# Fails unless the libraries are hardened: hardening.sh COMPILE-COMMANDS [SHARED-LIBRARY]...
#
# Most options leave a trace in a shared library; the others are read from the commands that compiled its sources.
set -eu
commands=$1
shift
status=0
complain() {
    echo "$1" >&2
    status=1
}

[ -f "$commands" ] || { echo "no file $commands" >&2; exit 1; }
compiled=
for target in IC ic_zq ic_vxlog; do  # an object lies in a folder of its target's name, wherever the checkout is
    of_target=$(grep -E "\"command\": .* -o ([^ ]*/)?CMakeFiles/$target\.dir/" "$commands") ||
        { echo "$commands has no source of $target" >&2; exit 1; }
    compiled="$compiled$of_target
"
done
compiled=${compiled%?}
without() {
    printf '%s\n' "$compiled" | grep -v -e "$1" | sed 's/.* -c /  /' || true
}
for option in -fstack-protector-strong -fstack-clash-protection; do
    lacking=$(without "$option")
    [ -z "$lacking" ] || complain "compiled without $option: $lacking"
done
lacking=$(without '-D_FORTIFY_SOURCE=2' | grep . || true)
if printf '%s\n' "$compiled" | grep -q -e ' -O[23s]'; then
    [ -z "$lacking" ] || complain "optimised without _FORTIFY_SOURCE: $lacking"
fi

for library; do
    [ -f "$library" ] || { echo "no library $library" >&2; exit 1; }
    dynamic=$(readelf --dynamic --wide "$library")
    segments=$(readelf --program-headers --wide "$library")
    symbols=$(readelf --dyn-syms --wide "$library")

    echo "$segments" | grep -q GNU_RELRO || complain "$library: relocations stay writable (no -z relro)"
    echo "$dynamic" | grep -q 'FLAGS_1.* NOW' || complain "$library: symbols are bound lazily (no -z now)"
    echo "$segments" | grep -q 'GNU_STACK.* RW ' || complain "$library: the stack is executable (no -z noexecstack)"
    echo "$symbols" | grep -q __stack_chk_fail || complain "$library: the stack is not protected"

    # A sanitizer's code stands before a function's, and its run-time library is linked to the program alone.
    ! echo "$symbols" | grep -qE '__(asan|tsan|ubsan)_' || continue

    undefined=$(ldd -r "$library" 2>&1 | grep 'undefined symbol' || true)
    [ -z "$undefined" ] || complain "$library: symbols are undefined (no -z defs): $undefined"

    [ "$(uname -m)" = x86_64 ] || continue
    functions=$(echo "$symbols" | awk '$4 == "FUNC" && $7 != "UND" { sub(/^0+/, "", $2); print $2 }' | sort -u)
    landings=$(objdump --disassemble --no-show-raw-insn "$library" |
        awk '$2 == "endbr64" { sub(":", "", $1); print $1 }' | sort -u)
    [ -n "$functions" ] || complain "$library: exports no function"
    open=$(printf '%s\n' "$landings" "$landings" "$functions" | sort | uniq -u)
    [ -z "$open" ] || complain "$library: functions without a landing pad (-fcf-protection) at: $open"
done
exit $status
