# Sourced by the benchmarks that download. start_nginx WORK PROBE serves
# WORK/www on a free loopback port and returns once PROBE (a path under it)
# answers; sets port and nginx_pid, which the caller stops. nginx_extra, when
# set, goes into the configuration's http block in place of "access_log off;".
start_nginx() {
  local work=$1
  port=$(python3 -c 'import socket; s = socket.socket(); s.bind(("127.0.0.1", 0)); print(s.getsockname()[1])')
  mkdir -p "$work/temp"
  # nginx's workers run as an unprivileged user when started by root.
  chmod -R a+rX "$work"
  cat >"$work/nginx.conf" <<CONF
daemon off;
worker_processes 1;
pid $work/nginx.pid;
error_log $work/error.log warn;
events { worker_connections 64; }
http {
  ${nginx_extra:-access_log off;}
  sendfile on;
  tcp_nopush on;
  client_body_temp_path $work/temp/body;
  proxy_temp_path $work/temp/proxy;
  fastcgi_temp_path $work/temp/fastcgi;
  uwsgi_temp_path $work/temp/uwsgi;
  scgi_temp_path $work/temp/scgi;
  server {
    listen 127.0.0.1:$port;
    root $work/www;
  }
}
CONF
  nginx -p "$work" -c "$work/nginx.conf" &
  nginx_pid=$!
  for _ in $(seq 50); do
    curl -sf -o /dev/null -r 0-0 "http://127.0.0.1:$port/$2" && return
    sleep 0.1
  done
  echo "nginx did not start" >&2
  cat "$work/error.log" >&2
  exit 1
}
