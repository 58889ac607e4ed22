#!/bin/sh
# start DIR: nginx serves DIR/www on a free 127.0.0.1 port (in DIR/server.port); stop DIR ends it by its PID.
set -u
action=$1
dir=$2
here=$(cd "$(dirname "$0")" && pwd)
case "$action" in
start)
    mkdir -p "$dir/www/vt" "$dir/run"
    rm -f "$dir/server.port"
    # A port the system hands out as free; nginx takes it a moment later.
    port=$(/usr/bin/python3 -c 'import socket; s = socket.socket(); s.bind(("127.0.0.1", 0)); print(s.getsockname()[1])')
    "$here/../../deploy/serve-updates" "127.0.0.1:$port" "$dir/www" "$dir/run" </dev/null >"$dir/nginx.log" 2>&1 &
    echo $! >"$dir/server.pid"
    i=0
    until /usr/bin/python3 -c "import socket; socket.create_connection(('127.0.0.1', $port), 0.2)" 2>/dev/null; do
        i=$((i + 1))
        if [ $i -gt 50 ] || ! kill -0 "$(cat "$dir/server.pid")" 2>/dev/null; then
            echo "nginx did not start:"; cat "$dir/nginx.log" "$dir/run/error.log" 2>/dev/null; exit 1
        fi
        sleep 0.1
    done
    echo "$port" >"$dir/server.port"
    ;;
stop)
    [ -s "$dir/server.pid" ] || exit 0
    pid=$(cat "$dir/server.pid")
    kill -QUIT "$pid" 2>/dev/null
    i=0
    while kill -0 "$pid" 2>/dev/null && [ $i -lt 50 ]; do i=$((i + 1)); sleep 0.1; done
    kill -0 "$pid" 2>/dev/null && kill -KILL "$pid" 2>/dev/null
    rm -f "$dir/server.pid" "$dir/server.port"
    ;;
esac
exit 0
