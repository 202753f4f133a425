#!/bin/sh
# Process-level tests of zkini: output, exit status and file contents.
# Usage: zkini_test.sh CASE SOURCE_DIR WORKDIR COMMAND...
# COMMAND runs zkini (with an emulator in front when cross-compiled).
set -u
case_name=$1 src=$2 work=$3
shift 3

rm -rf "$work" && mkdir -p "$work" || exit 1
cp "$src/examples/sample.ini" "$work/a.ini"
cp "$src/examples/overrides.ini" "$work/b.ini"
cd "$work" || exit 1
failures=0
tab=$(printf '\t')

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

# says PATTERN: standard error of the last run matches the fixed text.
says() { grep -qF -- "$1" err.txt || fail "no '$1' in: $(cat err.txt)"; }

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

unchanged() { [ "$(cat a.ini; echo x)" = "$original" ] || fail "a.ini was changed ($*)"; }

case $case_name in
get)
    run 0 "$@" -file:a.ini -get -section:SERVER -key:Port
    same out.txt '8080
'
    run 1 "$@" -file:a.ini -get -section:server -key:none
    same out.txt ''
    same err.txt "zkini: no key 'none' in section 'server' of a.ini
"
    run 1 "$@" -file:a.ini -get -section:none -key:port -quiet
    same err.txt ''
    printf 'lead = 1\n[s]\n' >lead.ini
    run 0 "$@" -file:lead.ini -get -section: -key:lead
    same out.txt '1
'
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
    says "no section 'none'"
    ;;
set)
    run 0 "$@" -file:a.ini -set -section:server -key:port -value:9 -out:c.ini
    unchanged
    sed 's/^port = 8080$/port = 9/' a.ini >expected.ini
    cmp -s c.ini expected.ini || fail "-set changed more than the port line: $(diff expected.ini c.ini)"
    run 1 "$@" -file:a.ini -set -section:server -key:none -value:1 -existing
    unchanged -existing
    run 0 "$@" -file:a.ini -set -section:server -key:port -value:2 -existing
    run 0 "$@" -file:new.ini -set -section:s -key:k "-value:a b"
    run 0 "$@" -file:new.ini -get -section:s -key:k
    same out.txt 'a b
'
    run 0 "$@" -file:a.ini -get -section:server -key:port
    same out.txt '2
'
    while IFS='|' read -r section key value; do
        run 2 "$@" -file:a.ini -set "-section:$section" "-key:$key" "-value:$value" </dev/null
        says "cannot be written"
    done <<'ROWS'
a]b|k|v
s|=k|v
s|;k|v
s| k|v
s|k|v 
ROWS
    ;;
delete)
    run 0 "$@" -file:a.ini -delete -section:server -key:none
    unchanged
    run 1 "$@" -file:a.ini -delete -section:none -existing
    says "no section 'none' in a.ini"
    unchanged
    run 0 "$@" -file:a.ini -delete -section:server -key:TIMEOUT -out:c.ini
    grep -v '^timeout' a.ini >expected.ini
    cmp -s c.ini expected.ini || fail "-delete changed more than one line: $(diff expected.ini c.ini)"
    run 0 "$@" -file:a.ini -delete -section:database
    run 0 "$@" -file:a.ini -list
    same out.txt 'server
IPsBehindFirewall
'
    ;;
merge)
    run 0 "$@" -file:a.ini -merge:b.ini -out:m.ini
    unchanged
    run 0 "$@" -file:m.ini -list -format:json
    same out.txt '{"server": {"host": "0.0.0.0", "port": "9090", "timeout": "30"}, "database": {"url": "postgres://localhost/app", "pool": "4"}, "IPsBehindFirewall": {"10.0.0.5": "web", "10.0.0.6": "db"}, "cache": {"size": "256"}}
'
    run 3 "$@" -file:a.ini -merge:none.ini
    same err.txt 'zkini: cannot read none.ini: No such file or directory
'
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
usage)
    # Each row ends with the word the message must name; a.ini stays as it was.
    for args in "-section:server -key:port -dry-run" "-section:server -key:port -value:1 -show" "-fix" \
        "-set -section:server -key:port -value:1 -verbose" "-set -section:server -key:port -value" \
        "-section:server -key:port -get:x" "-list -list" "-list stray" "-section:server -key:port -Get" \
        "-get -section:server -key:port -value:1" "-list -format" "-list -format:xml" "-list -quiet -quiet" \
        "-set -section:server -key:port -value:1 -out:" "-get -section:server -key:port -out:x.ini" \
        "-list --list" "-list -version" "-section:server -get" "-file:a.ini"; do
        # shellcheck disable=SC2086
        run 2 "$@" -file:a.ini $args
        last=${args##* }
        says "${last%%:*}"
        says "zkini -help"
        unchanged "$args"
    done
    run 2 "$@"
    run 2 "$@" -file:- -batch:- -list
    ;;
status)
    for help in -help --help -h; do
        run 0 "$@" $help
        grep -q '^exit status: 0 done; 1 no such section or key; 2 bad usage' out.txt || fail "$help: $(cat out.txt)"
    done
    for version in -version --version; do
        run 0 "$@" $version
        grep -Eqx 'zkini [0-9]+\.[0-9]+\.[0-9]+' out.txt || fail "$version: $(cat out.txt)"
    done
    run 3 "$@" -file:none.ini -get -section:s -key:k
    same err.txt 'zkini: cannot read none.ini: No such file or directory
'
    run 3 "$@" -file:a.ini -set -section:s -key:k -value:v -out:missing/c.ini
    same err.txt 'zkini: cannot save missing/c.ini: No such file or directory
'
    # A node of its own, so that a faulty save could never take /dev/full.
    mknod full c 1 7 || fail "no device node can be made here"
    run 3 "$@" -file:a.ini -set -section:s -key:k -value:v -out:full
    says 'cannot save full: No space left on device'
    "$@" -file:a.ini -list >full 2>err.txt
    [ $? -eq 3 ] || fail "output into a full disk did not exit 3"
    says 'cannot write standard output: No space left on device'
    unchanged
    ;;
streams)
    run 0 "$@" -file:- -set -section:server -key:port -value:1 <a.ini
    sed 's/^port = 8080$/port = 1/' a.ini >expected.ini
    cmp -s out.txt expected.ini || fail "-file:- -set: $(diff expected.ini out.txt)"
    "$@" -file:- -get -section:server -key:port <out.txt >got.txt
    same got.txt '1
'
    run 0 "$@" -file:a.ini -delete -section:database -out:-
    sed '/^\[database\]/,/^$/d' a.ini >expected.ini
    cmp -s out.txt expected.ini || fail "-out:-: $(diff expected.ini out.txt)"
    run 0 "$@" -file:- -normalize <a.ini
    same out.txt "$normal_form"
    cat b.ini | "$@" -file:a.ini -merge:- -out:- | "$@" -file:- -get -section:cache -key:size >got.txt
    same got.txt '256
'
    unchanged
    ;;
batch)
    printf 'set\tserver\tport\t8443\n# a comment\r\n\nset\tnew section\tkey with space\ta $value\twith a tab\r\ndelete\tdatabase\ndelete\tserver\ttimeout\n' >ok.txt
    run 0 "$@" -file:a.ini -batch:ok.txt -out:c.ini
    unchanged
    run 0 "$@" -file:c.ini -list -format:json
    same out.txt '{"server": {"host": "0.0.0.0", "port": "8443"}, "IPsBehindFirewall": {"10.0.0.5": "web", "10.0.0.6": "db"}, "new section": {"key with space": "a $value\twith a tab"}}
'
    for third in "set${tab}s${tab}k" "remove${tab}server" "set${tab}s${tab} k${tab}v" "delete${tab}s${tab}k${tab}x"; do
        printf 'set\tserver\tport\t1\ndelete\tdatabase\n%s\nset\ts\tk\tv\n' "$third" >bad.txt
        run 2 "$@" -file:a.ini -batch:bad.txt
        says 'bad.txt line 3'
        unchanged "$third"
        run 2 "$@" -file:none.ini -batch:- <bad.txt
        [ ! -e none.ini ] || fail "a bad batch made the file"
    done
    printf 'delete\tserver\tnone\n' | "$@" -file:a.ini -batch:- -existing 2>err.txt
    [ $? -eq 1 ] || fail "-existing batch of a missing key did not exit 1"
    unchanged
    printf 'set\ts\tk\tv\n' | "$@" -file:a.ini -batch:- >out.txt 2>err.txt || fail "-batch:- failed: $(cat err.txt)"
    run 0 "$@" -file:a.ini -get -section:s -key:k
    same out.txt 'v
'
    ;;
formats)
    w1="it's" w2="two  spaces${tab}tab" w3='$HOME `id` $(id) "q"' w4='back\slash\\ \n'
    printf 'set\tq\tv1\t%s\nset\tq\tv2\t%s\nset\tq\tv3\t%s\nset\tq\tv4\t%s\n' \
        "$w1" "$w2" "$w3" "$w4" >values.txt
    run 0 "$@" -file:a.ini -batch:values.txt
    eval "$("$@" -file:a.ini -list -section:q -format:sh)"
    for n in 1 2 3 4; do
        eval "[ \"\$v$n\" = \"\$w$n\" ]" || fail "eval of v$n: $(eval "echo \"\$v$n\"")"
    done
    eval "$("$@" -file:a.ini -get -section:q -key:v3 -format:sh)"
    [ "$v3" = "$w3" ] || fail "eval of -get: $v3"
    run 0 "$@" -file:a.ini -list -format:json
    python3 -m json.tool out.txt >/dev/null || fail "-list -format:json does not parse: $(cat out.txt)"
    python3 -c 'import json, sys; print("\n".join(json.load(sys.stdin)["q"].values()))' <out.txt >got.txt
    same got.txt "$w1
$w2
$w3
$w4
"
    run 0 "$@" -file:a.ini -get -section:q -key:v4 -format:json
    python3 -c 'import json, sys; print(json.load(sys.stdin)["v4"])' <out.txt >got.txt
    same got.txt "$w4
"
    run 0 "$@" -file:a.ini -list -format:sh
    same out.txt "'server' 'database' 'IPsBehindFirewall' 'q'
"
    run 2 "$@" -file:a.ini -list -section:IPsBehindFirewall -format:sh
    says "'10.0.0.5' is not a shell name"
    same out.txt ''
    printf '[d]\nk=1\nK=2\n' >dup.ini
    run 0 "$@" -file:dup.ini -list -section:d -format:sh
    same out.txt "k='1'
"
    printf '[s]\nk=\377\n' >latin1.ini
    run 2 "$@" -file:latin1.ini -list -format:json
    ;;
lock)
    i=1 pids=''
    while [ $i -le 20 ]; do
        "$@" -file:a.ini -set -section:many -key:k$i -value:$i 2>>err.txt &
        pids="$pids $!"
        i=$((i + 1))
    done
    for pid in $pids; do wait "$pid" || fail "a concurrent -set failed: $(cat err.txt)"; done
    run 0 "$@" -file:a.ini -list -section:many
    [ "$(sort out.txt)" = "$(seq 1 20 | sed 's/.*/k&=&/' | sort)" ] || fail "concurrent sets kept: $(cat out.txt)"
    # A batch waiting on a FIFO holds the lock until it is killed.
    mkfifo changes
    exec 3<>changes
    "$@" -file:a.ini -batch:changes 3>&- &
    holder=$!
    inode=$(stat -c %i a.ini) n=0
    until grep -q ":$inode " /proc/locks || [ $n -ge 200 ]; do sleep 0.1; n=$((n + 1)); done
    [ $n -lt 200 ] || fail "the batch never locked a.ini"
    kill -9 "$holder"
    wait "$holder"
    exec 3>&-
    run 0 "$@" -file:a.ini -set -section:server -key:port -value:1
    ;;
log)
    run 0 "$@" -file:a.ini -set -section:server -key:port -value:1 -log:changes.log -out:c.ini
    run 3 "$@" -file:a.ini -set -section:server -key:port -value:2 -log:changes.log -out:missing/c.ini
    run 0 "$@" -file:a.ini -delete -section:server -key:none -log:changes.log
    [ "$(wc -l <changes.log)" -eq 1 ] || fail "expected one log line: $(cat changes.log)"
    grep -Eq '^[0-9]{2}:[0-9]{2}:[0-9]{2} [0-9]{2}/[0-9]{2}/[0-9]{2}  a\.ini: set \[server\] port=1 -> c\.ini$' changes.log ||
        fail "log line: $(cat changes.log)"
    ;;
docs)
    command -v man >/dev/null || { echo "man is not installed"; exit 77; }
    MANWIDTH=80 man --warnings -l "$src/tools/zkini/zkini.1" >out.txt 2>err.txt || fail "man failed"
    same err.txt ''
    grep -q '^EXIT STATUS' out.txt || fail "the man page has no exit status"
    bash -n "$src/tools/zkini/zkini.bash-completion" || fail "bash -n refused the completion script"
    ;;
*)
    fail "no such case: $case_name"
    ;;
esac

if [ "$failures" -eq 0 ]; then echo "1 passed, 0 failed"; else echo "0 passed, 1 failed"; exit 1; fi
