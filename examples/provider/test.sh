#!/bin/sh
# test.sh FOLDER PROGRAM [ARGUMENT]...: fails unless the provider prints provider.txt while the files of the sensors
# change. Each step waits until the program has printed the result of the step before it.
set -eu
here=$(cd "$(dirname "$0")" && pwd)
rm -rf "$1"
mkdir -p "$1/hwmon/hwmon0" "$1/hwmon/hwmon1"
cd "$1"
shift

# put FILE TEXT: replaces the file at once, so that the program never reads half of it.
put() {
    echo "$2" >new
    mv new "hwmon/$1"
}

# await TEXT: waits until the program has printed the text, at most a minute.
await() {
    for _ in $(seq 600); do
        if grep -q "$1" output; then return; fi
        sleep 0.1
    done
    exit 1
}

while read -r file text; do
    put "$file" "$text"
done <"$here/sensors.txt"
: >output
{
    await 'hwmon1/temp2: '
    put hwmon0/temp1_input 71000
    await 'Inlet: 71 is above '
    rm hwmon/hwmon0/fan1_input
    await 'Front fan: cannot be read'
    put hwmon0/fan1_input 3500
    await 'Front fan: 3500 is normal'
    cat "$here/requests.txt"
} | "$@" hwmon 0.05 >>output
diff "$here/provider.txt" output
