# shellcheck shell=bash
# A private CUPS scheduler in a folder of the user's, for machines on which none answers.
: "${source_dir:?}"

# The folder that everything private lives in. Root's home is closed to user lp, as whom root's scheduler runs its
# filters and backends.
state_dir() {
    if [[ -n ${XDG_STATE_HOME:-} ]]; then
        printf '%s/ventrasagent\n' "$XDG_STATE_HOME"
    elif ((EUID == 0)); then
        printf '/var/lib/ventrasagent\n'
    else
        printf '%s/.local/state/ventrasagent\n' "${HOME:?}"
    fi
}

scheduler_answers() {
    [[ $(LC_ALL=C timeout 20 lpstat -r 2>/dev/null) == 'scheduler is running' ]]
}

# socket_path DIR: where the scheduler of that folder listens. A socket address holds 107 characters, and a scheduler
# with a longer one runs on without hearing anybody: such a folder gets a socket elsewhere, and remembers where.
socket_path() {
    local dir=$1 link=$1/socket-folder
    if ((${#dir} <= 90)); then
        printf '%s/cups.sock\n' "$dir"
        return
    fi
    [[ -O $link && -d $link ]] || ln -sfn "$(mktemp -d "${TMPDIR:-/tmp}/ventras.XXXXXXXX")" "$link"
    chmod "$(folder_mode)" "$link/"
    printf '%s/cups.sock\n' "$(readlink "$link")"
}

# Everything is the user's alone; but user lp has to get to root's spool.
folder_mode() {
    if ((EUID == 0)); then echo 755; else echo 700; fi
}

# make_programs DIR: the machine's parts of a scheduler, and the agent's own backends. The stock backends that only root
# may run ("usb", "lpd") are copied for an ordinary user, whose scheduler would refuse queues for them.
make_programs() {
    local part stock=/usr/lib/cups/backend/usb dir=$1 own=$source_dir/build/release/bin
    mkdir -p "$dir/backend" "$dir/daemon"
    for part in cgi-bin driver filter monitor notifier; do
        ln -sfn "/usr/lib/cups/$part" "$dir/$part"
    done
    for part in /usr/lib/cups/daemon/*; do
        ln -sfn "$part" "$dir/daemon/${part##*/}"
    done
    for part in /usr/lib/cups/backend/*; do
        borrow "$part" "$dir/backend/${part##*/}"
    done
    [[ -x $own/ippusb ]] && install -m 755 "$own/ippusb" "$dir/backend/"
    # Where the agent is installed, the stock backend for USB has made way already.
    [[ -e /usr/lib/cups/daemon/stock-usb ]] && stock=/usr/lib/cups/daemon/stock-usb
    if [[ -x $own/usb && -r $stock ]]; then
        borrow "$stock" "$dir/daemon/stock-usb"
        rm -f "$dir/backend/usb"
        install -m "$(root_backend_mode)" "$own/usb" "$dir/backend/"
    fi
}

# borrow PROGRAM LINK
borrow() {
    if ((EUID == 0)); then
        ln -sfn "$1" "$2"
    elif [[ -r $1 ]]; then
        install -m 755 "$1" "$2"
    fi
}

# A backend that others may not run is run as root, by root's scheduler.
root_backend_mode() {
    if ((EUID == 0)); then echo 744; else echo 755; fi
}

# make_drivers DIR: the machine's data files of a scheduler, with its drivers registered for the agent.
make_drivers() {
    local part dir=$1
    rm -rf "${dir:?}"
    mkdir -p "$dir/drv" "$dir/model"
    for part in /usr/share/cups/*; do
        case ${part##*/} in
            drv | model) ln -sfn -t "$dir/${part##*/}" "$part"/* 2>/dev/null || true ;;
            *) ln -sfn "$part" "$dir/${part##*/}" ;;
        esac
    done
    rm -f "$dir/drv/Library" "$dir/model/Library"
    "$source_dir/data/ventrasagent-register-drivers" "$dir"
}

write_scheduler_settings() {
    local dir=$1 socket=$2
    cat >"$dir/etc/cups-files.conf" <<END
ServerRoot $dir/etc
StateDir $dir/run
CacheDir $dir/cache
RequestRoot $dir/spool
TempDir $dir/spool/tmp
ServerKeychain $dir/etc/ssl
ServerBin $dir/bin
DataDir $dir/data
DocumentRoot /usr/share/cups/doc-root
AccessLog $dir/log/access_log
ErrorLog $dir/log/error_log
PageLog $dir/log/page_log
Printcap
SystemGroup $(id -gn)
END
    cat >"$dir/etc/cupsd.conf" <<END
LogLevel info
MaxLogSize 1m
Listen $socket
Browsing No
WebInterface No
DefaultAuthType Basic
ErrorPolicy retry-job
<Location />
  Order allow,deny
  Allow localhost
</Location>
<Location /admin>
  AuthType Default
  Require user @SYSTEM
  Order allow,deny
  Allow localhost
</Location>
<Policy default>
  JobPrivateAccess default
  JobPrivateValues default
  SubscriptionPrivateAccess default
  SubscriptionPrivateValues default
  <Limit CUPS-Add-Modify-Printer CUPS-Delete-Printer CUPS-Set-Default Pause-Printer Resume-Printer Enable-Printer Disable-Printer CUPS-Accept-Jobs CUPS-Reject-Jobs>
    AuthType Default
    Require user @SYSTEM
    Order deny,allow
  </Limit>
  <Limit All>
    Order deny,allow
  </Limit>
</Policy>
END
}

# use_private_scheduler DIR: from here on every client in this script talks to the scheduler of that folder, which is
# started unless it runs already. CUPS_SERVERROOT keeps clients from taking PPDs of the system's queues for its own.
use_private_scheduler() {
    local dir=$1 socket
    mkdir -p "$dir"/etc/ppd "$dir"/etc/ssl "$dir"/cache "$dir"/run/certs "$dir"/spool/tmp "$dir"/log "$dir"/bin
    chmod "$(folder_mode)" "$dir"
    socket=$(socket_path "$dir")
    export CUPS_SERVER=$socket CUPS_SERVERROOT=$dir/etc
    # One at a time: a second scheduler would take the socket away from the first.
    exec {start_lock}>"$dir/lock"
    flock "$start_lock"
    scheduler_answers || start_scheduler "$dir" "$socket"
    exec {start_lock}>&-
}

start_scheduler() {
    local dir=$1 socket=$2
    if ((EUID == 0)) && ! setpriv --reuid=lp --regid=lp --clear-groups test -x "$dir"; then
        die "user lp cannot enter $dir, but prints from there; set XDG_STATE_HOME to a folder that all may enter"
    fi
    make_programs "$dir/bin"
    make_drivers "$dir/data"
    write_scheduler_settings "$dir" "$socket"
    setsid /usr/sbin/cupsd -f -c "$dir/etc/cupsd.conf" -s "$dir/etc/cups-files.conf" \
        </dev/null >>"$dir/log/output" 2>&1 {start_lock}>&- &
    scheduler_pid=$!
    printf '%s\n' "$scheduler_pid" >"$dir/cupsd.pid"
    wait_until 100 scheduler_answers || die "the private scheduler does not answer; see $dir/log/error_log"
}

# wait_until TENTHS COMMAND...: whether the command succeeds within so many tenths of a second.
wait_until() {
    local left=$1
    shift
    until "$@"; do
        ((left-- > 0)) || return 1
        sleep 0.1
    done
}

# stop_scheduler: ends the scheduler that this script started, if it did.
stop_scheduler() {
    [[ -n ${scheduler_pid:-} ]] || return 0
    kill "$scheduler_pid" 2>/dev/null || true
    wait "$scheduler_pid" 2>/dev/null || true
    scheduler_pid=
}
