#!/bin/sh
# Process-level tests of zkini: output, exit status and file contents.
# Usage: zkini_test.sh CASE EXAMPLES WORKDIR COMMAND...
# COMMAND runs zkini (with an emulator in front when cross-compiled).
set -u
case_name=$1 examples=$2 work=$3
shift 3

rm -rf "$work" && mkdir -p "$work" || exit 1
cp "$examples/sample.ini" "$work/a.ini"
cp "$examples/overrides.ini" "$work/b.ini"
cd "$work" || exit 1
failures=0

fail() { echo "FAIL: $*"; failures=$((failures + 1)); }

# run EXPECTED_STATUS ARGS...: runs zkini, keeping stdout and stderr.
run() {
    want=$1; shift
    "$@" >out.txt 2>err.txt
    got=$?
    [ "$got" -eq "$want" ] || fail "zkini $* exited $got, expected $want ($(cat err.txt))"
}

# same FILE TEXT: the file holds exactly TEXT.
same() {
    printf '%s' "$2" >expected.txt
    cmp -s "$1" expected.txt || { fail "$1 differs:"; diff expected.txt "$1"; }
}

normal_form='[server]
host=0.0.0.0
port=8080
# seconds before an idle connection is closed
timeout=30

[database]
url=postgres://localhost/app
pool=4

[IPsBehindFirewall]
10.0.0.5=web
10.0.0.6=db

'
original=$(cat a.ini; echo x)

unchanged() { [ "$(cat a.ini; echo x)" = "$original" ] || fail "a.ini was changed"; }

case $case_name in
get)
    run 0 "$@" -file:a.ini -get -section:SERVER -key:Port
    same out.txt '8080
'
    run 1 "$@" -file:a.ini -get -section:server -key:none
    same out.txt ''
    run 1 "$@" -file:a.ini -get -section:none -key:port
    unchanged
    ;;
list)
    run 0 "$@" -file:a.ini -list
    same out.txt 'server
database
IPsBehindFirewall
'
    run 0 "$@" -file:a.ini -list -section:database
    same out.txt 'url=postgres://localhost/app
pool=4
'
    run 1 "$@" -file:a.ini -list -section:none
    ;;
set)
    run 0 "$@" -file:a.ini -set -section:server -key:port -value:9 -out:c.ini
    unchanged
    run 0 "$@" -file:c.ini -get -section:server -key:port
    same out.txt '9
'
    run 0 "$@" -file:new.ini -set -section:s -key:k "-value:a b"
    same new.ini '[s]
k=a b

'
    run 0 "$@" -file:new.ini -set -section:t -key:empty -value:
    same new.ini '[s]
k=a b

[t]
empty=

'
    ;;
delete)
    run 1 "$@" -file:a.ini -delete -section:server -key:none
    unchanged
    run 0 "$@" -file:a.ini -delete -section:server -key:TIMEOUT
    run 0 "$@" -file:a.ini -list -section:server
    same out.txt 'host=0.0.0.0
port=8080
'
    ;;
merge)
    run 0 "$@" -file:a.ini -merge:b.ini -out:m.ini
    unchanged
    same m.ini "$(printf '%s' "$normal_form" | sed 's/^port=8080$/port=9090/')

[cache]
size=256

"
    run 2 "$@" -file:a.ini -merge:none.ini
    grep -q "cannot read none.ini: No such file or directory" err.txt || fail "no reason for the missing merge file"
    unchanged
    ;;
forms)
    run 0 "$@" -file:a.ini -normalize -out:n.ini
    same n.ini "$normal_form"
    run 0 "$@" -file:a.ini -firewall -out:f.ini
    same f.ini "$(printf '%s' "$normal_form" | sed 's/^\(10\.0\.0\.[56]\)=/\1/')

"
    run 0 "$@" -file:a.ini -normalize
    same a.ini "$normal_form"
    ;;
errors)
    run 2 "$@"
    grep -q '^usage: zkini' err.txt || fail "no usage text"
    run 2 "$@" -file:a.ini -get -list
    run 2 "$@" -file:a.ini -get -section:server
    run 2 "$@" -file:a.ini -set -section:s -key:k
    run 2 "$@" -file:none.ini -get -section:s -key:k
    same err.txt 'zkini: cannot read none.ini: No such file or directory
'
    run 2 "$@" -file:a.ini -set -section:s -key:k -value:v -out:missing/c.ini
    same err.txt 'zkini: cannot save missing/c.ini: No such file or directory
'
    unchanged
    [ ! -e missing ] || fail "the missing directory was made"
    run 0 "$@" -help
    grep -q '^usage: zkini' out.txt || fail "no usage text for -help"
    run 0 "$@" -version
    grep -Eq '^zkini [0-9]+\.[0-9]+' out.txt || fail "no version: $(cat out.txt)"
    ;;
log)
    run 0 "$@" -file:a.ini -set -section:server -key:port -value:1 -log:changes.log -out:c.ini
    run 2 "$@" -file:a.ini -set -section:server -key:port -value:2 -log:changes.log -out:missing/c.ini
    run 0 "$@" -file:a.ini -get -section:server -key:port -log:changes.log
    [ "$(wc -l <changes.log)" -eq 1 ] || fail "expected one log line: $(cat changes.log)"
    grep -Eq '^[0-9]{2}:[0-9]{2}:[0-9]{2} [0-9]{2}/[0-9]{2}/[0-9]{2}  a\.ini: set \[server\] port=1 -> c\.ini$' changes.log ||
        fail "log line: $(cat changes.log)"
    ;;
*)
    fail "no such case: $case_name"
    ;;
esac

if [ "$failures" -eq 0 ]; then echo "1 passed, 0 failed"; else echo "0 passed, 1 failed"; exit 1; fi
