#!/usr/bin/env bash
# Starts the real program on an X server of its own (Xvfb) with a sample
# database and checks that its main window appears with the database
# loaded, then ends it with Ctrl+Q as a user would and checks that it went
# through its normal shutdown. Skips (exit 77) only when xvfb-run is missing.
#
#   real_window_test.sh CARDOVEX SAMPLE_DIR
set -u
program=$1
samples=$2

if ! command -v xvfb-run >/dev/null 2>&1; then
  echo "SKIP: xvfb-run is not installed (scripts/install-deps installs it)"
  exit 77
fi
for tool in xdotool xauth; do
  command -v "$tool" >/dev/null 2>&1 || { echo "FAIL: $tool is not installed"; exit 1; }
done

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
cp "$samples/Contacts.PDB" "$work/Contacts.PDB"
chmod u+w "$work/Contacts.PDB"

# Everything the program writes stays in the scratch folder.
export HOME=$work/home XDG_CONFIG_HOME=$work/home/config XDG_RUNTIME_DIR=$work/runtime
export CARDOVEX_DATA_DIR=$work/data
mkdir -p "$HOME"
unset QT_QPA_PLATFORM

cat > "$work/inner.sh" <<'INNER'
#!/usr/bin/env bash
set -u
program=$1 file=$2 work=$3 how=$4
# xvfb-run goes on when its server fails to start; tell that apart from a
# program that does not show its window. (The server runs with -noreset:
# otherwise it resets when this probe disconnects, and a loaded machine
# refuses the program's connection during the reset.)
for _ in $(seq 1 50); do
  xdotool getdisplaygeometry >/dev/null 2>&1 && break
  sleep 0.1
done
xdotool getdisplaygeometry >/dev/null 2>&1 || exit 3
QT_QPA_PLATFORM=xcb "$program" "$file" >"$work/program.log" 2>&1 &
pid=$!
window=""
# Up to 20 s for the window: a loaded machine starts slowly.
for _ in $(seq 1 200); do
  window=$(xdotool search --onlyvisible --name '^Contacts \(4/4\) - Cardovex$' 2>/dev/null | head -n 1)
  [ -n "$window" ] && break
  kill -0 "$pid" 2>/dev/null || break
  sleep 0.1
done
if [ -z "$window" ]; then
  echo "FAIL: no window titled 'Contacts (4/4) - Cardovex' appeared"
  echo "windows:"; xdotool search --name '.' getwindowname %@ 2>/dev/null | sed 's/^/  /'
  cat "$work/program.log"
  kill "$pid" 2>/dev/null; wait "$pid" 2>/dev/null
  exit 1
fi
echo "window $window: $(xdotool getwindowname "$window")"
if command -v import >/dev/null 2>&1; then
  timeout 10 import -window root "$work/screen.png" 2>/dev/null || true
fi
if [ "$how" = term ]; then
  # As a logout (or `kill`) ends it.
  kill -TERM "$pid"
else
  # Without a window manager the focus must be given explicitly.
  xdotool windowfocus --sync "$window" 2>/dev/null || xdotool windowfocus "$window"
  xdotool key --clearmodifiers ctrl+q
fi
for _ in $(seq 1 100); do
  kill -0 "$pid" 2>/dev/null || break
  sleep 0.1
done
if kill -0 "$pid" 2>/dev/null; then
  echo "FAIL: the program did not end ($how)"
  kill "$pid" 2>/dev/null; sleep 0.5; kill -9 "$pid" 2>/dev/null
  wait "$pid" 2>/dev/null
  exit 1
fi
wait "$pid"
code=$?
[ "$code" -eq 0 ] || { echo "FAIL: exit code $code"; cat "$work/program.log"; exit 1; }
exit 0
INNER
chmod +x "$work/inner.sh"

# Either way of ending goes through the normal end, which writes the file
# used last and the preferences.
conf=$XDG_CONFIG_HOME/Cardovex/Cardovex.conf
for how in quit term; do
  rm -f "$conf"
  for _ in 1 2 3; do
    # A display number of its own each time: the server of the run before
    # may still be ending on the number xvfb-run would otherwise pick again.
    timeout 120 xvfb-run -a -n $((200 + RANDOM % 700)) -s "-screen 0 1024x768x24 -nolisten tcp -noreset" "$work/inner.sh" "$program" "$work/Contacts.PDB" "$work" "$how"
    code=$?
    [ "$code" -eq 3 ] || break
    echo "the X server did not start; trying again"
    sleep 1
  done
  [ "$code" -eq 0 ] || exit 1
  if ! grep -q "LastFileUsed=.*Contacts.PDB" "$conf" 2>/dev/null || ! grep -q "AutoSave=1" "$conf"; then
    echo "FAIL: the settings were not written at the end ($how):"
    cat "$conf" 2>/dev/null
    exit 1
  fi
done
echo "PASS"
