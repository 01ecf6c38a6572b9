#!/bin/sh
# The exported interface of a library, as libabigail reads it from the library and its debug information.
#
#   abi.sh describe LIBRARY DESCRIPTION INCLUDE-FOLDER...    writes the description
#   abi.sh compare LIBRARY DESCRIPTION INCLUDE-FOLDER...     fails unless the library is as described
set -eu
command=$1
library=$2
description=$3
shift 3

[ -f "$library" ] || { echo "no library $library" >&2; exit 1; }
described=$description
if [ "$command" = compare ]; then
    [ -f "$description" ] || { echo "no description $description; scripts/checks/refresh-abi writes it" >&2; exit 1; }
    described=$(mktemp)
    trap 'rm -f "$described"' EXIT
fi

# Only what a program sees: types of the public headers, no paths, no lines, no names of parameters.
for folder; do
    set -- "$@" --headers-dir "$folder"
    shift
done
abidw "$@" --drop-private-types --exported-interfaces-only --drop-undefined-syms --no-parameter-names --no-corpus-path \
    --no-comp-dir-path --no-show-locs --no-elf-needed --type-id-style hash --out-file "$described" "$library"
[ "$command" = compare ] || exit 0

# Additions count: nothing is exported by chance.
abidiff --no-default-suppression --harmless "$description" "$described" || {
    echo "$(basename "$library") exports another interface than $description; docs/compatibility.md says what to do" >&2
    exit 1
}
