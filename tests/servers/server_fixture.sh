#!/bin/sh
# start DIR SCRIPT [ARGS...]: a test server in the background, waiting for DIR/server.port; stop DIR ends its PID.
set -u
action=$1
dir=$2
case "$action" in
start)
    shift 2
    mkdir -p "$dir"
    rm -f "$dir/server.port"
    "$@" --port-file "$dir/server.port" </dev/null >"$dir/server.log" 2>&1 &
    echo $! >"$dir/server.pid"
    i=0
    while [ ! -s "$dir/server.port" ]; do
        i=$((i + 1))
        if [ $i -gt 100 ] || ! kill -0 "$(cat "$dir/server.pid")" 2>/dev/null; then
            echo "server did not start:"; cat "$dir/server.log"; exit 1
        fi
        sleep 0.1
    done
    ;;
stop)
    [ -s "$dir/server.pid" ] || exit 0
    pid=$(cat "$dir/server.pid")
    kill "$pid" 2>/dev/null
    i=0
    # Gone, or a zombie waiting for whoever adopted it to reap it.
    while kill -0 "$pid" 2>/dev/null && ! grep -q '^[0-9]* ([^)]*) Z' "/proc/$pid/stat" 2>/dev/null &&
        [ $i -lt 50 ]; do i=$((i + 1)); sleep 0.1; done
    rm -f "$dir/server.pid" "$dir/server.port"
    ;;
esac
exit 0
