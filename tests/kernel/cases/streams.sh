# watch and record: what a controller sends, with nothing lost but what the kernel drops.
. /bench/lib.sh

# recording NAME ARGUMENT...: starts to record into /out/NAME.hid, and returns once that is open.
recording() {
    local name="$1"
    shift
    background "$name" -- vesk-report record -O "/out/$name.hid" "$@"
    waitFor 10 "$name.hid" test -s "/out/$name.hid"
}

# recorded NAME COUNT: until the recording holds so many reports.
enough() { [ "$(grep -c '^[EF]:' "/out/$1.hid")" -ge "$2" ]; }
recorded() { waitFor 20 "$2 reports in $1.hid" enough "$1" "$2"; }

controller plain

# --- at leisure and in a hurry
background watch60 -- vesk-report watch --count 200
waitOpen plain
tell plain 'stream 60 200 76,77'
finish watch60
background watch1000 -- vesk-report watch --count 1000
waitOpen plain
recording record1000 --count 1000
tell plain 'stream 1000 1000 76'
finish watch1000
finish record1000
step decode1000 -- vesk-report decode /out/record1000.hid
background mixed -- vesk-report watch --count 60 --report adc-dump-packet
waitOpen plain
tell plain 'stream 200 120 76,77'
finish mixed
background jsonl -- vesk-report watch --count 10 -o jsonl
waitOpen plain
tell plain 'stream 100 10 76'
finish jsonl
background csv -- vesk-report watch --count 2 -o csv
waitOpen plain
tell plain 'send 76' 'send 76'
finish csv
step no-document -- vesk-report watch -o json

# --- more than the kernel keeps
background burst -- vesk-report watch --count 64
waitOpen plain
tell plain 'burst 200 76' 'wait 500' 'send 76'
finish burst
recording sleeper --duration 2.5
signalStep sleeper STOP
tell plain 'stream 1000 100 76' wait-sent
waitLog plain 'streamed 100 '
signalStep sleeper CONT
recorded sleeper 63
tell plain 'send 76' 'skip 76 5' 'send 76'
finish sleeper
step sleeper-decoded -- vesk-report decode /out/sleeper.hid

# --- feature reports beside the stream
recording features --feature 0xE0@0.2 --feature version@0.5 --duration 1.9
tell plain 'stream 100 100 76'
finish features
tell plain 'fault df mute' 'fault de error'
recording mute --feature 0xDF@10 --feature 0xDE@10 --timeout 1.5 --duration 3
tell plain 'stream 200 300 76'
finish mute
background poll -- vesk-report watch --report black-box-summary --interval 0.1 --count 3
finish poll
tell plain 'contents de 00'
background changes -- vesk-report watch --report adc-dump-state --interval 0.05 --changes-only --count 2 -o hex
tell plain 'fault de none'
waitLines changes 1
tell plain 'contents de 03'
finish changes

# --- reports that are not as they should be
background sized -- vesk-report watch --count 3
waitOpen plain
tell plain 'send 76 1000' 'send 77 2065' 'send 77'
finish sized

# --- signals, and output that goes away
recording interrupted
tell plain 'stream 100 20 76'
recorded interrupted 20
signalStep interrupted INT
finish interrupted
background terminated -- vesk-report watch
waitOpen plain
tell plain 'stream 100 5 77'
waitLines terminated 360  # five packets of 70 lines between two empty ones
signalStep terminated TERM
finish terminated
recording killed
tell plain 'stream 100 20 76'
recorded killed 20
signalStep killed KILL
finish killed
step killed-decoded -- vesk-report decode /out/killed.hid -o jsonl
background pipe -- sh -c '{ vesk-report watch; echo $? >/out/pipe.code; } | head -n 3'
waitOpen plain
tell plain 'stream 50 50 76'
finish pipe
waitLog plain 'streamed 50 '
background full -- vesk-report watch -O /dev/full
waitOpen plain
tell plain 'send 76'
finish full

# --- the live view
background view --tty 80x24 -- vesk-report watch --view --scan P --count 60
waitOpen plain
tell plain 'stream 60 30 76,77' wait-sent 'skip 76 4' 'stream 60 30 76,77'
finish view
background plain-view -- vesk-report watch --view --count 2
waitOpen plain
tell plain 'send 76' 'send 76'
finish plain-view

# --- away and back
background queued -- vesk-report watch
waitOpen plain
signalStep queued STOP
tell plain 'burst 5 76' unplug
waitLog plain unplugged
signalStep queued CONT
finish queued
tell plain replug
waitLog plain ' node ' 2
background reconnected -- vesk-report watch --reconnect --count 6
waitOpen plain
tell plain 'burst 3 76' 'wait 200' unplug
waitLines reconnected 1 err
tell plain replug
waitLog plain ' node ' 3
waitLines reconnected 2 err
tell plain 'stream 50 3 76'
finish reconnected
