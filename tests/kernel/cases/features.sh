# The commands that ask a device for its feature reports, and those that only look for it.
. /bench/lib.sh

# --- what there is
step list-none -- vesk-report list
step read-none -- vesk-report read all
controller mouse --name 'Bench Mouse' --id 046d:c077 --uniq '' --descriptor mouse
step no-controller -- vesk-report read all
controller plain
controller virtual --name 'Vesk on nothing' --bus virtual --descriptor split --uniq BENCH0002
controller spi --name 'Vesk auf dem Gerätebus' --bus spi --id 1234:5679 --uniq BENCH0003
step list --user nobody -- vesk-report list
step list-json --user nobody -- vesk-report list -o json

# --- which one is meant
step ambiguous -- vesk-report read 0xE0
step ambiguous-ids -- vesk-report read 0xE0 --device 1234:5678
step by-ids -- vesk-report read 0xE0 --device 1234:5679
step by-serial -- vesk-report read 0xE0 --device BENCH0002
step by-path -- vesk-report read 0xE0 --device "$(node virtual)"
ln -s "$(node plain)" /dev/vesk
step by-link -- vesk-report read 0xE0 --device /dev/vesk
step no-such -- vesk-report read 0xE0 --device NOSUCH
step no-path -- vesk-report read 0xE0 --device /dev/hidraw77
step no-node -- vesk-report read 0xE0 --device /dev/null
step mouse -- vesk-report read 0xE0 --device "$(node mouse)"
tell virtual quit
tell spi quit
waitLog virtual '^[0-9]* end'
waitLog spi '^[0-9]* end'

# --- all is well
step read-all -- vesk-report read all
step read-raw -- vesk-report read all -o raw
step read-json -- vesk-report read all -o json
step read-two -- vesk-report read black-box-summary 0xD0 --headers
step snapshot -- vesk-report snapshot -O /out/snapshot.hid
step snapshot-decoded -- vesk-report decode /out/snapshot.hid
step anonymous -- vesk-report snapshot --no-identity
step full-disk -- vesk-report snapshot -O /dev/full

# --- rights
step denied --user nobody -- vesk-report read 0xE0 --device 1234:5678
step denied-json --user nobody -- vesk-report read 0xE0 -o json
step rule --user nobody -- vesk-report udev-rule
{ sleep 0.4; chmod 0644 "$(node plain)"; } &
step soon-allowed --user nobody -- vesk-report read 0xE0
step allowed --user nobody -- vesk-report read 0xE0
chmod 0600 "$(node plain)"

# --- faults
tell plain 'fault e0 error' 'fault e1 short 3' 'fault e2 empty' 'fault e3 wrong e4' 'fault e4 late 300' \
    'fault df mute' 'fault dc long 10'
for id in e0 e1 e2 e3 e4 dc; do step "fault-$id" -- vesk-report -v read "0x$id"; done
step fault-df -- vesk-report read 0xDF --timeout 0.4
step fault-df-kernel -- vesk-report read 0xDF
step fault-lenient -- vesk-report read 0xE1 --lenient
step fault-snapshot -- vesk-report snapshot --timeout 0.5 -O /out/faults.hid
step fault-decoded -- vesk-report decode /out/faults.hid
step fault-json -- vesk-report read all --timeout 0.5 -o json
step progress --tty 80x24 -- vesk-report read 0xDF 0xE5 --timeout 0.5

# --- interrupted, and gone
# waiting NAME ARGUMENT...: runs vesk-report until it waits for the answer that does not come.
waiting() {
    local name="$1" before
    shift
    before=$(grep -c 'get-report df' /out/plain.log)
    background "$name" -- vesk-report "$@"
    waitLog plain 'get-report df' $((before + 1))
}
waiting interrupted snapshot -O /out/interrupted.hid
signalStep interrupted INT
finish interrupted
waiting terminated read 0xE5 0xDF
signalStep terminated TERM
finish terminated
waiting gone read 0xE5 0xDF 0xDE
tell plain unplug
finish gone
