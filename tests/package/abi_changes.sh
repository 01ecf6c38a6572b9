#!/bin/sh
# Changes a small library in several ways and fails unless abi.sh finds each change: abi_changes.sh COMPILER WORK
set -eu
compiler=$1
work=$2
abi=$(CDPATH='' cd "$(dirname "$0")" && pwd)/abi.sh
rm -rf "$work"
mkdir -p "$work/include"
status=0

# build SED-EXPRESSION: builds the library with one change.
build() {
    sed "$1" >"$work/include/Probe.h" <<'END'
#include <string>
class __attribute__((visibility("default"))) Probe {
public:
    enum Unit { CELSIUS, KELVIN };
    explicit Probe(unsigned int channel);
    virtual ~Probe();
    virtual double read() const;
    std::string name() const;
private:
    void calibrate();
    unsigned int channel_;
    Unit unit_ = CELSIUS;
};
END
    sed "$1" >"$work/Probe.cpp" <<'END'
#include "Probe.h"
namespace {
int inside() { return 20; }
}
Probe::Probe(unsigned int channel) : channel_(channel) { calibrate(); }
Probe::~Probe() = default;
double Probe::read() const { return inside(); }
std::string Probe::name() const { return "probe"; }
void Probe::calibrate() { channel_ += 0; }
// more
END
    "$compiler" -std=c++17 -g -fPIC -fvisibility=hidden -shared -I"$work/include" "$work/Probe.cpp" \
        -o "$work/libprobe.so"
}

compare() {
    "$abi" compare "$work/libprobe.so" "$work/probe.abi" "$work/include" >"$work/log" 2>&1
}

# finds WHAT SED-EXPRESSION: abi.sh must refuse the library with this change.
finds() {
    build "$2"
    if compare; then
        echo "not found: $1" >&2
        status=1
    fi
}

build ''
if compare || ! grep -q 'no description' "$work/log"; then
    echo "abi.sh accepts a missing description" >&2
    status=1
fi
"$abi" describe "$work/libprobe.so" "$work/probe.abi" "$work/include"
[ -s "$work/probe.abi" ] || { echo "abi.sh wrote no description" >&2; exit 1; }

build 's/return 20/return 21/; s/double Probe::read() const {/& int local = 1; (void)local;/'
compare || { cat "$work/log" >&2; echo "abi.sh refuses an unchanged interface" >&2; status=1; }

finds "a function is gone" '/name() const/d'
finds "a function takes another type" 's/unsigned int channel)/unsigned long channel)/'
finds "a function returns another type" 's/double \(Probe::\)*read/float \1read/'
finds "a class is larger" 's/^    Unit unit_/    int reserved_ = 0;\n&/'
finds "members have changed places" \
    's/^    unsigned int channel_;//; s/^    Unit unit_.*/&\n    unsigned int channel_;/'
finds "a virtual function comes before the others" 's/^    virtual ~Probe/    virtual void reset() {}\n&/'
finds "an enumerator has another value" 's/CELSIUS, KELVIN/KELVIN, CELSIUS/'
finds "a function is new" \
    's|^// more|__attribute__((visibility("default"))) int more() { return 1; }|'
exit $status
