#!/bin/sh
# Fails unless the library given exports its public names and nothing else: exports.sh LIBRARY INCLUDE-FOLDER
set -eu
export LC_ALL=C  # in Turkish, I is not between A and Z
library=$1
include=$2
[ -f "$library" ] || { echo "no library $library" >&2; exit 1; }

exported=$(nm --dynamic --defined-only --demangle --format=posix "$library" | sed 's/ [A-Za-z] [0-9a-f]* *[0-9a-f]*$//')
status=0

# Other namespaces, which may also follow the return type of a template, and internals of the library must be absent.
foreign=$(echo "$exported" |
    grep -vE '^IC::(([A-Za-z0-9]+::)*operator|(~?[A-Za-z0-9]+(::|\[abi:cxx11\])?)+(\(|$))' |
    grep -vE '^(typeinfo|typeinfo name|vtable) for IC::[A-Za-z0-9]+$' || true)
inside=$(echo "$exported" | grep -E 'IC::detail|logger' || true)
# So must names in the namespace that no header declares. Operators are not searched: their names are those of types.
names=$(echo "$exported" | sed 's/\[abi:cxx11\]//g; s/(.*//; s/^.* for //' | grep -E '^IC::[A-Za-z0-9:~]*$' |
    grep -v operator | sed 's/.*::~*//' | sort -u)
[ -n "$names" ] || { echo "$library exports nothing" >&2; exit 1; }
for name in $names; do
    grep -qrw "$name" "$include" || inside="$inside $name"
done
if [ -n "$foreign$inside" ]; then
    echo "exported, but not public:" "$foreign" "$inside" >&2
    status=1
fi

# One example of each kind of name must be present.
for name in 'IC::pst' 'IC::pB' 'IC::Number::setKind' 'IC::EnumValue::operator std::' 'IC::PropertyValue::setKind' \
    'IC::Error::Error' 'IC::Alert::hexstring' 'IC::Node::Node' 'IC::operator<<' 'IC::operator==(IC::Number' \
    'IC::operator<(IC::PropertyValue' \
    'typeinfo name for IC::ICException' 'typeinfo for IC::ICException' 'typeinfo for IC::PropertyValueInvalidKind' \
    'typeinfo for IC::NodeInvalidSensor' 'typeinfo for IC::Node' 'vtable for IC::Node'; do
    if ! echo "$exported" | grep -qF "$name"; then
        echo "not exported: $name" >&2
        status=1
    fi
done
exit $status
