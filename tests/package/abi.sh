#!/bin/sh
# Describes the exported interface of a library, which libabigail reads from the library and its debug information.
#
#   abi.sh describe LIBRARY DESCRIPTION INCLUDE-FOLDER...    writes the description
#   abi.sh compare LIBRARY DESCRIPTION INCLUDE-FOLDER...     fails unless the library matches the description
set -eu
command=$1
library=$2
description=$3
shift 3

[ -f "$library" ] || { echo "no library $library" >&2; exit 1; }
described=$description
if [ "$command" = compare ]; then
    [ -f "$description" ] || { echo "no description $description; scripts/checks/refresh-abi writes it" >&2; exit 1; }
    described=$PWD/$(basename "$library").abi
    trap 'rm -f "$described"' EXIT
    trap 'exit 1' HUP INT TERM
fi

# Programs depend on the types of the public headers alone, not on paths, lines and names of parameters.
for folder; do
    set -- "$@" --headers-dir "$folder"
    shift
done
abidw "$@" --drop-private-types --exported-interfaces-only --drop-undefined-syms --no-parameter-names --no-corpus-path \
    --no-comp-dir-path --no-show-locs --no-elf-needed --type-id-style hash --out-file "$described" "$library"
[ "$command" = compare ] || exit 0

# An addition is a difference, too: an export is a promise.
abidiff --no-default-suppression --harmless "$description" "$described" || {
    echo "$(basename "$library") exports another interface than $description; docs/compatibility.md says what to do" >&2
    exit 1
}
