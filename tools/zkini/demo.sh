#!/bin/sh
# The README's demo: zkini on the shipped sample. Usage: demo.sh EXAMPLES OUTDIR [COMMAND...]
# where COMMAND runs zkini (with an emulator in front when cross-compiled).
set -e
examples=$1 out=$2
shift 2
mkdir -p "$out"
cp "$examples/sample.ini" "$out/sample.ini"
ini="$out/sample.ini"

echo "\$ zkini -file:sample.ini -list"
"$@" -file:"$ini" -list
echo "\$ zkini -file:sample.ini -get -section:server -key:port"
"$@" -file:"$ini" -get -section:server -key:port
echo "\$ zkini -file:sample.ini -set -section:server -key:port -value:8443 -out:copy.ini"
"$@" -file:"$ini" -set -section:server -key:port -value:8443 -out:"$out/copy.ini"
echo "\$ zkini -file:copy.ini -get -section:server -key:port"
"$@" -file:"$out/copy.ini" -get -section:server -key:port
echo "\$ zkini -file:copy.ini -merge:overrides.ini"
"$@" -file:"$out/copy.ini" -merge:"$examples/overrides.ini"
echo "--- copy.ini after the merge:"
cat "$out/copy.ini"
