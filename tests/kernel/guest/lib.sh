# For guest scripts: controllers, steps, and waiting for both. Everything that a check needs ends up under /out.

kPoll=0.01

die() {
    echo "bench: $*" >&2
    exit 1
}

# waitFor SECONDS WHAT COMMAND...: until the command succeeds.
waitFor() {
    local left=$(($1 * 100)) what="$2"
    shift 2
    until "$@" >/dev/null 2>&1; do
        left=$((left - 1))
        [ "$left" -gt 0 ] || die "waited in vain for $what"
        sleep $kPoll
    done
}

# controller NAME [OPTION]... [COMMAND]...: plugs one in and returns when its node is there.
controller() {
    local name="$1"
    shift
    mkfifo "/run/$name.control"
    command controller --log "/out/$name.log" --control "/run/$name.control" "$@" &
    waitLog "$name" ' node '
}

# node NAME: the node that it has now.
node() {
    sed -n 's/^[0-9]* node //p' "/out/$1.log" | tail -n 1
}

# tell NAME COMMAND...: all commands in one piece, so that nothing comes between.
tell() {
    local name="$1"
    shift
    if grep '^[0-9]* error ' "/out/$name.log" >&2; then die "controller $name has ended"; fi
    printf '%s\n' "$@" 1<>"/run/$name.control" # opened both ways, which never waits for a reader
}

# waitLog NAME PATTERN [COUNT]: until that many lines of its log match.
logHolds() { [ "$(grep -c "$2" "/out/$1.log")" -ge "$3" ]; }
waitLog() { waitFor 10 "'$2' in the log of $1" logHolds "$1" "$2" "${3:-1}"; }

# waitOpen NAME: until a reader has its node open, and a little longer, because the kernel tells the device first.
isOpen() { [ "$(grep -oE ' (open|close|stop)$' "/out/$1.log" | tail -n 1)" = ' open' ]; }
waitOpen() {
    waitFor 10 "a reader of $1" isOpen "$1"
    sleep 0.1
}

# step NAME [--user U] [--limit S] [--tty CxR] -- COMMAND...: never fails; what came out is in /out/steps/NAME.
step() {
    local name="$1"
    shift
    command step "/out/steps/$name" "$@" || die "step $name could not be run"
}

# background NAME ...: the same, returns once it runs. Then signalStep, waitLines, finish.
background() {
    local name="$1"
    step "$@" &
    waitFor 10 "the start of $name" test -s "/out/steps/$name/pid"
}

signalStep() { kill "-$2" "$(cat "/out/steps/$1/pid")"; }
finish() { waitFor "${2:-35}" "the end of $1" test -s "/out/steps/$1/status"; }

# waitLines NAME COUNT [out|err]: until the running step has printed that many whole lines.
linesReached() { [ "$(wc -l <"/out/steps/$1/$3")" -ge "$2" ]; }
waitLines() { waitFor 20 "$2 lines of $1" linesReached "$1" "$2" "${3:-out}"; }
