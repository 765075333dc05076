# Proves the bench itself, with a bare hidraw reader.
. /bench/lib.sh

# --- feature reports, as they should be
controller plain
for id in a2 a9 d0 d2 dc de df e0 e1 e2 e3 e4 e5 ea ec; do
    step "get-$id" -- probe get "$(node plain)" "$id"
done
step get-unknown -- probe get "$(node plain)" 11
step get-cut -- probe get "$(node plain)" e0 4
step get-huge -- probe get "$(node plain)" e0 4097
tell plain 'contents de 02'
step get-changed -- probe get "$(node plain)" de

# --- faults
tell plain 'fault e0 error' 'fault e1 short 3' 'fault e2 empty' 'fault e3 wrong e4' 'fault e4 late 300' \
    'fault df mute' 'fault dc long 10' 'fault a9 error 32'
for id in e0 e1 e2 e3 e4 df dc a9 e5; do
    step "fault-$id" -- probe get "$(node plain)" "$id"
done
tell plain 'fault e0 none'
step fault-gone -- probe get "$(node plain)" e0

# --- input reports
background paced -- probe read "$(node plain)" 60 2000
waitLines paced 1
tell plain 'stream 60 60 76,77'
finish paced
background fast -- probe read "$(node plain)" 1000 2000
waitLines fast 1
tell plain 'stream 1000 1000 76'
finish fast
background sized -- probe read "$(node plain)" 3 500
waitLines sized 1
tell plain 'send 76 100' 'send 76 1000' 'send 77' 'cookie 09' 'send 76'
finish sized

# --- more reports than the queue holds
background burst -- probe read "$(node plain)" 1000 1000
waitLines burst 1
tell plain 'burst 200 76' 'wait 300' 'send 76'
finish burst
background stopped -- probe read "$(node plain)" 1000 1000
waitLines stopped 1
signalStep stopped STOP
tell plain 'stream 1000 100 76' wait-sent 'send 77'
waitLog plain 'streamed 100 '
signalStep stopped CONT
finish stopped
background skipping -- probe read "$(node plain)" 3 1000
waitOpen plain
tell plain 'send 76' 'skip 76 5' 'send 76' 'send 76'
finish skipping

# --- unplug and replug
background queued -- probe read "$(node plain)" 1000 5000
waitLines queued 1
signalStep queued STOP
tell plain 'burst 5 76' unplug
waitLog plain unplugged
signalStep queued CONT
finish queued
step gone -- probe get /dev/hidraw0 e0
tell plain 'wait 100' replug
waitLog plain ' node ' 2
step replugged -- probe get "$(node plain)" e0
background pending -- probe get "$(node plain)" df
waitLog plain 'get-report df' 3
tell plain unplug
finish pending
tell plain replug 'wait-open 50' 'unplug-after 7' 'stream 200 0 76,77'
waitLog plain ' node ' 3
background counted -- probe read "$(node plain)" 1000 5000
finish counted

# --- others on the same machine
controller mouse --name 'Bench Mouse' --id 046d:c077 --uniq '' --descriptor mouse
controller spi --name 'Vesk on SPI' --bus spi --uniq BENCH0002
controller virtual --bus virtual --descriptor split --version 0203
controller writable
for name in mouse spi virtual writable; do
    node=$(node "$name")
    step "uevent-$name" -- cat "/sys/class/hidraw/${node#/dev/}/device/uevent"
    step "descriptor-$name" -- cat "/sys/class/hidraw/${node#/dev/}/device/report_descriptor"
done
step set -- probe set "$(node writable)" e0
step write -- probe write "$(node writable)" 76
step denied --user nobody -- probe get "$(node spi)" e0
chmod 0644 "$(node spi)"
step allowed --user nobody -- probe get "$(node spi)" e0
tell spi quit
waitLog spi '^[0-9]* end'

# --- steps
background interrupted -- probe read "$(node virtual)" 10 20000
waitLines interrupted 1
signalStep interrupted INT
finish interrupted
step terminal --tty 100x30 -- sh -c 'test -t 1 && stty size; echo to the other stream >&2; exit 5'
step binary -- sh -c 'cat /bench/bin/probe; printf "no line end" >&2'
step limit --limit 1 -- sleep 20
step nothing -- no-such-program
