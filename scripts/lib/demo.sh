# shellcheck shell=bash
# The demonstration: a virtual printer on loopback gets a queue, and a page comes out of it.
: "${source_dir:?}"

port_is_open() {
    (exec 3<>"/dev/tcp/127.0.0.1/$1") 2>/dev/null
}

printer_runs() {
    kill -0 "$printer_pid" 2>/dev/null
}

# printer_listens PORT: whether it is our printer, and not somebody else's, that answers there.
printer_listens() {
    local socket
    socket=$(awk -v port="$(printf ':%04X' "$1")" '$2 ~ port "$" && $4 == "0A" { print $10; exit }' /proc/net/tcp)
    [[ -n $socket && -n $(find "/proc/$printer_pid/fd" -lname "socket:\\[$socket\\]" 2>/dev/null) ]]
}

printer_has_settled() {
    printer_listens "$1" || ! printer_runs
}

# start_printer DIR: sets printer_uri. The first port is taken on which nobody answers and the printer can listen.
start_printer() {
    local dir=$1 port
    rm -rf "${dir:?}/pages"
    mkdir -p "$dir/tls" "$dir/pages"
    printf '#!/bin/sh\nexit 0\n' >"$dir/receive"
    chmod 755 "$dir/receive"
    for ((port = 8631; port < 8651; port++)); do
        port_is_open "$port" && continue
        # The preload stands in for the DNS-SD daemon, without which ippeveprinter does not start even unadvertised.
        LD_PRELOAD=$source_dir/build/release/tests/parts/libventras-no-avahi.so ippeveprinter -r off -n localhost \
            -p "$port" -d "$dir/pages" -k -K "$dir/tls" -c "$dir/receive" -2 -s 20,10 \
            -f application/pdf,image/urf -M Demonstration -m "Colour Printer" -l "this computer" "Demonstration Printer" \
            </dev/null >"$dir/printer.log" 2>&1 &
        printer_pid=$!
        if wait_until 50 printer_has_settled "$port" && printer_listens "$port"; then
            printer_uri=ipp://localhost:$port/ipp/print
            return
        fi
        stop_printer
    done
    die "the virtual printer does not start; see $dir/printer.log"
}

stop_printer() {
    [[ -n ${printer_pid:-} ]] || return 0
    kill "$printer_pid" 2>/dev/null || true
    wait "$printer_pid" 2>/dev/null || true
    printer_pid=
}

demo_page() {
    cat <<END

    A page for the Demonstration Printer

    The agent asked this printer what it can do, made a queue for it, and
    this text went through that queue: $1
    $(date)
END
}

job_is_over() {
    LC_ALL=C lpstat -W completed -o "${1%-*}" | grep -q "^$1 "
}

# print_page QUEUE: sets job.
print_page() {
    job=$(demo_page "$1" | LC_ALL=C lp -d "$1" -t page - | sed -n 's/^request id is \([^ ]*\).*/\1/p')
    [[ -n $job ]] || die "queue $1 did not take the page"
    wait_until 600 job_is_over "$job" || die "the page is not through after a minute; lpstat -p says: $(lpstat -p "$1")"
}

# came_out DIR: what the printer received. It keeps whole documents only, and an empty file beside each.
came_out() {
    find "$1/pages" -type f -size +0 -printf '    %p (%s bytes)\n'
}

end_demonstration() {
    [[ -z ${queue:-} ]] || lpadmin -x "$queue" || true
    stop_printer
    stop_scheduler
}

# The demonstration has its own scheduler even where one runs: it asks for no rights, and no queue of the user's is near.
demonstrate() {
    local dir pages
    dir=$(state_dir)/demo
    mkdir -p "$dir"
    exec {demo_lock}>"$dir/lock"
    flock -n "$demo_lock" || die "another demonstration is running"
    trap end_demonstration EXIT
    use_private_scheduler "$dir/cups"
    start_printer "$dir/printer"
    printf 'A virtual printer answers at %s\n' "$printer_uri"
    queue=$(run_agent "$printer_uri" | sed -n 's/^Queue ID://p')
    [[ -n $queue ]] || die "the agent made no queue"
    printf 'The agent asked it what it can do, and made the queue %s for it.\n' "$queue"
    print_page "$queue"
    pages=$(came_out "$dir/printer")
    [[ -n $pages ]] || die "nothing came out of the printer; see $dir/cups/log/error_log"
    printf 'A page went through that queue as job %s, and came out at the printer:\n' "$job"
    printf '%s\n' "$pages"
    printf 'Now with a printer of yours: scripts/run ipp://HOST/ipp/print\n'
}
