# A small machine with two shares, a daemon, a file server and a system log.

readonly STATE=/run/demo # its logs and what the last step left
readonly MONITOR_DIRECTORY=/usr/vano/etc/vanotifyd

make_machine() {
    mkdir -p $STATE $MONITOR_DIRECTORY
    : >$STATE/fileindexd.log
    : >$STATE/smbd.log
    make_shares
    make_services
    make_samba
    make_notify_tool
    "$PROGRAMS/log_listener" >$STATE/syslog 2>&1 &
    LOG_LISTENER=$!
    wait_for test -S /dev/log
}

stop_machine() {
    /etc/init.d/fileindexd stop
    kill $LOG_LISTENER
}

wait_for() { # COMMAND...: up to five seconds
    local i
    for ((i = 0; i < 100; i++)); do
        "$@" && return 0
        sleep 0.05
    done
    return 1
}

# Small files, but whole ones.
make_shares() {
    mkdir -p /volume1/photos/2016 /volume2/media/films /volume2/media/music
    base64 --decode >/volume1/photos/2016/trip.jpg <<'FILE'
/9j/4AAQSkZJRgABAQEASABIAAD/2wBDAP//////////////////////////////////////////
////////////////////////////////////////////wgALCAABAAEBAREA/8QAFBABAAAAAAAA
AAAAAAAAAAAAAP/aAAgBAQABPxA=
FILE
    base64 --decode >/volume1/photos/2016/map.png <<'FILE'
iVBORw0KGgoAAAANSUhEUgAAAAEAAAABCAYAAAAfFcSJAAAADUlEQVR42mNk+M9QDwADhgGAWjR9
awAAAABJRU5ErkJggg==
FILE
    printf 'The trip of 2016.\n' >/volume1/photos/2016/notes.txt
    # One frame of two by two pixels; eight samples of silence.
    printf 'YUV4MPEG2 W2 H2 F25:1 Ip A1:1 C420jpeg\nFRAME\n\100\200\300\100\200\200' \
        >/volume2/media/films/clip.y4m
    printf 'RIFF\54\0\0\0WAVEfmt \20\0\0\0\1\0\1\0\100\37\0\0\100\37\0\0\1\0\10\0data\10\0\0\0' \
        >/volume2/media/music/silence.wav
    printf '\200\200\200\200\200\200\200\200' >>/volume2/media/music/silence.wav
    set_shares photos /volume1/photos media /volume2/media
}

set_shares() { # NAME DIRECTORY NAME DIRECTORY
    printf '{"%s":"%s","%s":"%s"}\n' "$@" >/usr/vano/etc/shares.json
}

make_services() {
    local header='### BEGIN INIT INFO
# Provides:          NAME
# Required-Start:    $remote_fs $syslog
# Required-Stop:     $remote_fs $syslog
# Default-Start:     2 3 4 5
# Default-Stop:      0 1 6
# Short-Description: NAME of the demonstration
### END INIT INFO'
    cat >/etc/init.d/fileindexd <<SCRIPT
#!/bin/sh
${header//NAME/fileindexd}
daemon="start-stop-daemon --quiet --oknodo --pidfile /run/fileindexd.pid"
case \$1 in
start)
    # Ready when it listens: the library speaks to it next.
    \$daemon --start --background --make-pidfile --no-close --startas "$PROGRAMS/indexing_peer" \\
        -- --interval 100 >>$STATE/fileindexd.log 2>&1 || exit 1
    for i in \$(seq 100); do
        [ -S /run/fileindexd.sock ] && exit 0
        sleep 0.05
    done
    exit 1
    ;;
stop) \$daemon --stop --remove-pidfile --retry TERM/5/KILL/5 ;;
restart) "\$0" stop && "\$0" start ;;
status) \$daemon --status ;;
*) exit 2 ;;
esac
SCRIPT
    cat >/etc/init.d/smbd <<SCRIPT
#!/bin/sh
${header//NAME/smbd}
echo "\$1" >>$STATE/smbd.log
SCRIPT
    chmod +x /etc/init.d/fileindexd /etc/init.d/smbd
}

make_samba() {
    mkdir -p /var/lib/samba/private /run/samba /var/cache/samba /var/log/samba
    printf '[global]\n    include = registry\n' >/etc/samba/smb.conf
}

make_notify_tool() {
    printf '#!/bin/sh\nprintf "%%s\\n" "$*" >>%s/notices\n' $STATE >/usr/vano/bin/vanozemnotify
    chmod +x /usr/vano/bin/vanozemnotify
}

# --- what state the machine is in -------------------------------------------------------------

service_state() {
    local state=stopped boot=off
    /etc/init.d/fileindexd status >/dev/null 2>&1 && state=running
    compgen -G '/etc/rc3.d/S*fileindexd' >/dev/null && boot=on
    echo "$state $boot"
}

spotlight_state() {
    testparm -s --parameter-name=spotlight 2>/dev/null | tr '[:upper:]' '[:lower:]'
}

restart_count() {
    grep --count --line-regexp restart $STATE/smbd.log
}
