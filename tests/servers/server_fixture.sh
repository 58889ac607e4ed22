#!/bin/sh
# start DIR SCRIPT [ARGS...]: a test server in the background, waiting for DIR/server.port;
# start DIR nginx: nginx as the update server (deploy/serve-updates) serving DIR/www on a free 127.0.0.1 port;
# stop DIR ends the server by its PID.
set -u
action=$1
dir=$2
here=$(cd "$(dirname "$0")" && pwd)
case "$action" in
start)
    shift 2
    mkdir -p "$dir"
    rm -f "$dir/server.port"
    port=
    if [ "$1" = nginx ]; then
        mkdir -p "$dir/www/vt" "$dir/run"
        # A port the system hands out as free; nginx takes it a moment later.
        port=$(/usr/bin/python3 -c 'import socket; s = socket.socket(); s.bind(("127.0.0.1", 0)); print(s.getsockname()[1])')
        "$here/../../deploy/serve-updates" "127.0.0.1:$port" "$dir/www" "$dir/run" </dev/null >"$dir/server.log" 2>&1 &
    else
        "$@" --port-file "$dir/server.port" </dev/null >"$dir/server.log" 2>&1 &
    fi
    echo $! >"$dir/server.pid"
    i=0
    while [ ! -s "$dir/server.port" ]; do
        if [ -n "$port" ] && /usr/bin/python3 -c "import socket; socket.create_connection(('127.0.0.1', $port), 0.2)" 2>/dev/null; then
            echo "$port" >"$dir/server.port"
            break
        fi
        i=$((i + 1))
        if [ $i -gt 100 ] || ! kill -0 "$(cat "$dir/server.pid")" 2>/dev/null; then
            echo "server did not start:"; cat "$dir/server.log" "$dir/run/error.log" 2>/dev/null; exit 1
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
    kill -KILL "$pid" 2>/dev/null
    rm -f "$dir/server.pid" "$dir/server.port"
    ;;
esac
exit 0
