# What the demonstration prints: steps, commands, what they changed, and the checks.

TITLES=() # of the steps so far
GOOD=()   # checks that went well, a number for each step
WRONG=()  # the others

if [[ $COLOUR == yes ]]; then
    readonly BOLD=$'\e[1m' GREEN=$'\e[32m' RED=$'\e[31m' DIM=$'\e[2m' PLAIN=$'\e[0m'
else
    readonly BOLD= GREEN= RED= DIM= PLAIN=
fi

# --- steps and commands -----------------------------------------------------------------------

heading() {
    printf '\n%s%s%s\n%s\n' "$BOLD" "$1" "$PLAIN" "${1//?/-}"
}

step() {
    TITLES+=("$1")
    GOOD+=(0)
    heading "${#TITLES[@]}. $1"
}

# Runs a command, shows it and what it says, and checks its exit status.
run() { # STATUS COMMAND...
    local wanted=$1 status
    shift
    printf '%s$ %s%s\n' "$BOLD" "$*" "$PLAIN"
    PATH=$PROGRAMS:$PATH "$@" 2>&1 | sed 's/^/    /'
    status=${PIPESTATUS[0]}
    if [[ $status -eq $wanted ]]; then
        GOOD[-1]=$((GOOD[-1] + 1))
    else
        expect "exit status $wanted, not $status: $*" false
    fi
}

note() {
    printf '    %s%s%s\n' "$DIM" "$1" "$PLAIN"
}

expect() { # TEXT COMMAND...
    local text=$1
    shift
    if "$@"; then
        GOOD[-1]=$((GOOD[-1] + 1))
        printf '  %sok%s     %s\n' "$GREEN" "$PLAIN" "$text"
    else
        WRONG+=("${#TITLES[@]}. $text")
        printf '  %sWRONG%s  %s\n' "$RED" "$PLAIN" "$text"
    fi
}

summary() {
    heading "Summary"
    local i text
    for i in "${!TITLES[@]}"; do
        printf '%3d. %-46s %2d checks ok\n' $((i + 1)) "${TITLES[i]}" "${GOOD[i]}"
    done
    for text in ${WRONG[@]+"${WRONG[@]}"}; do
        printf '%sWRONG%s  %s\n' "$RED" "$PLAIN" "$text"
    done
    if [[ ${#WRONG[@]} -eq 0 ]]; then
        printf '%sEverything went as expected.%s\n' "$GREEN" "$PLAIN"
    else
        printf '%s%d checks went wrong.%s\n' "$RED" ${#WRONG[@]} "$PLAIN"
        return 1
    fi
}

show_machine() {
    heading "A small machine"
    printf 'Two shares with some files, an indexing daemon, a file server:\n'
    find /volume1 /volume2 -type f -printf '    %p  %s bytes\n' | sort
}

# --- what a step changed ----------------------------------------------------------------------

# JSON with a member a line; good enough for what a settings file holds.
pretty() { # FILE...
    cat "$@" 2>/dev/null | awk '
        function newline() { printf "\n%*s", 2 * depth, "" }
        {
            inside = 0
            for (i = 1; i <= length($0); i++) {
                c = substr($0, i, 1)
                if (inside) {
                    printf "%s", c
                    if (c == "\\") printf "%s", substr($0, ++i, 1)
                    else if (c == "\"") inside = 0
                } else if (c ~ /[[{]/ && substr($0, i + 1, 1) ~ /[]}]/) printf "%s%s", c, substr($0, ++i, 1)
                else if (c ~ /[[{]/) { printf "%s", c; depth++; newline() }
                else if (c ~ /[]}]/) { depth--; newline(); printf "%s", c }
                else if (c == ",") { printf "%s", c; newline() }
                else if (c == ":") printf ": "
                else { printf "%s", c; if (c == "\"") inside = 1 }
            }
            printf "\n"
        }'
}

# The state of everything, in one directory of small texts.
take_state() { # DIRECTORY
    rm -rf "$1"
    mkdir -p "$1"
    pretty /usr/vano/etc/fileindex/folder.conf >"$1/folder.conf"
    pretty /usr/vano/etc/fileindex/status.conf >"$1/status.conf"
    awk '{ gsub(/,"/, ", \""); print }' /dev/null $(compgen -G "$MONITOR_DIRECTORY/*.json") >"$1/monitor"
    grep --no-filename . /volume?/*/@eaDir/VANO@file_index_queue{,.tmp} 2>/dev/null >"$1/queue"
    service_state | sed 's/ / now, at boot /' >"$1/service"
    spotlight_state >"$1/Spotlight"
    echo "$(restart_count) restarts" >"$1/smbd"
}

remember() {
    take_state $STATE/before
    LOG_SEEN=$(wc -l <$STATE/fileindexd.log)
    SYSLOG_SEEN=$(wc -l <$STATE/syslog)
}

# What the daemon printed since the step began, without the count and the queue of its events.
daemon_lines() {
    tail -n +$((LOG_SEEN + 1)) $STATE/fileindexd.log |
        sed -E 's/^command //; s/^(event|malformed) [0-9]+ [^:]*: /\1 /'
}

show_part() { # NAME, lines on standard input
    local name=$1 line part mark
    while IFS= read -r line; do
        case $line in
        +*) mark=$GREEN ;;
        -*) mark=$RED ;;
        *) mark= ;;
        esac
        while IFS= read -r part; do
            printf '  %s%-12s%s  %s%s%s\n' "$DIM" "$name" "$PLAIN" "$mark" "$part" "$PLAIN"
            name=
        done < <(fold --spaces --width=60 <<<"$line" | sed '2,$s/^/     /; s/ $//')
    done
}

# Lines that are gone and lines that are new.
show_difference() { # NAME
    diff --unified=0 $STATE/before/"$1" $STATE/after/"$1" | grep '^[-+]' | grep -v '^[-+][-+][-+] ' |
        show_part "$1"
}

show_changes() {
    take_state $STATE/after
    local part
    for part in folder.conf status.conf monitor queue service Spotlight smbd; do
        show_difference "$part"
    done
    daemon_lines | show_part daemon
    tail -n +$((SYSLOG_SEEN + 1)) $STATE/syslog | show_part "system log"
    STEP_LOG=$(daemon_lines)
    STEP_SYSLOG=$(tail -n +$((SYSLOG_SEEN + 1)) $STATE/syslog)
    CHANGED=$(diff --recursive --brief $STATE/before $STATE/after)
    remember
}

# Waits until the daemon has printed a line that begins so.
settle() { # TEXT
    wait_for daemon_has_printed "$1" || true # the checks will tell
}

daemon_has_printed() {
    daemon_lines | grep --quiet --fixed-strings -- "$1"
}

# --- what can be expected ---------------------------------------------------------------------

told() {
    grep --quiet --fixed-strings -- "$1" <<<"$STEP_LOG"
}

nothing_changed() {
    [[ -z $CHANGED && -z $STEP_LOG ]]
}

no_log_lines() {
    [[ -z $STEP_SYSLOG ]]
}

in_file() { # FILE TEXT
    grep --quiet --fixed-strings -- "$2" "$1"
}

not_in_file() { # FILE TEXT
    [[ -f $1 ]] && ! in_file "$@"
}

no_file() { # PATH...
    local path
    for path in "$@"; do
        [[ ! -e $path ]] || return 1
    done
}

status_is() { # PATH STATUS
    PATH=$PROGRAMS:$PATH fileindexctl show "$1" --json | grep --quiet --fixed-strings "\"status\":\"$2\""
}

service_is() {
    [[ $(service_state) == "$*" ]]
}

spotlight_is() {
    [[ $(spotlight_state) == "$1" ]]
}

restarts_are() {
    [[ $(restart_count) -eq $1 ]]
}

monitor_file() { # SHARE
    grep --files-with-matches --fixed-strings --recursive -- "/$1/@eaDir/" $MONITOR_DIRECTORY 2>/dev/null
}

monitored() { # FULL_PATH SHARE
    grep --quiet --fixed-strings -- \
        "\"config\":[{\"ignore\":[\"@eaDir\"],\"mask\":65486,\"path\":\"$1\"}]" \
        "$(monitor_file "$2")"
}

not_monitored() { # SHARE
    ! monitor_file "$1" >/dev/null
}
