#!/usr/bin/env bash
# Source this file: starts a private D-Bus session bus and a virtual X server for the tests
# and stops both when the sourcing shell exits. Never touches the user's own bus or display.
lumeris_test_env_dir=$(mktemp -d /tmp/lumeris-test-env.XXXXXX)
# Leaks inside system libraries that hold their state until the process ends (sanitizer build).
export LSAN_OPTIONS=${LSAN_OPTIONS:-suppressions=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)/tests/lsan.supp}

eval "$(dbus-daemon --session --fork --print-address=1 --print-pid=1 \
  --address="unix:path=$lumeris_test_env_dir/bus" | {
    read -r address; read -r pid
    echo "export DBUS_SESSION_BUS_ADDRESS='$address'; lumeris_dbus_pid=$pid"
  })"

lumeris_display=:$(( 90 + RANDOM % 400 ))
Xvfb "$lumeris_display" -screen 0 1280x800x24 -nolisten tcp >"$lumeris_test_env_dir/xvfb.log" 2>&1 &
lumeris_xvfb_pid=$!
export DISPLAY=$lumeris_display

lumeris_test_env_stop() {
  kill "${lumeris_dbus_pid:-}" "${lumeris_xvfb_pid:-}" 2>/dev/null || true
  rm -rf "$lumeris_test_env_dir"
}
trap lumeris_test_env_stop EXIT
