# The project's Wine: a separate prefix in the build folder, quiet, and without anything that would affect the user's
# desktop. A script that needs another prefix sets QEL_WINEPREFIX before it sources this.
# shellcheck shell=bash
. "$(dirname "${BASH_SOURCE[0]}")/common.sh"

export WINEPREFIX=${QEL_WINEPREFIX-$root/build/wine}
export WINEARCH=win64
export LC_ALL=C.UTF-8 # in another character set Wine mangles the letters of paths
export WINEDEBUG=-all
# Turns off .NET, the HTML engine, the debugger window on a fault, menu entries for registered file types, and
# Wayland.
export WINEDLLOVERRIDES="mscoree,mshtml,winedbg.exe,winemenubuilder.exe,winewayland.drv="

# Wine's services inherit standard input and output, so these are not pipes: a reader would wait as long as they run.
wine_boot() { wine wineboot "$@" >/dev/null 2>&1 </dev/null && wineserver -w; }

# wine_alone "$@": restarts the calling script under a lock, because several scripts register the extension in the prefix.
# Processes that the script leaves running do not hold the lock.
wine_alone() {
  [[ ${QEL_ALONE_IN-} != "$WINEPREFIX" ]] || return 0
  mkdir -p "$root/build"
  local lock=$WINEPREFIX.lock
  flock --nonblock "$lock" true || progress "Waiting for another script that uses Wine"
  QEL_ALONE_IN=$WINEPREFIX exec flock --close "$lock" "$0" "$@"
}

# Creates the prefix if it does not exist.
wine_make_prefix() {
  [[ ! -f $WINEPREFIX/.complete ]] || return 0
  "$root/scripts/setup" wine
  progress "Making a Wine prefix"
  mkdir -p "$WINEPREFIX"
  # The first boot of a new prefix sometimes fails. The second boot then completes the prefix.
  patiently wine_boot --init || patiently wine_boot --init || fail "Wine cannot make its prefix in $WINEPREFIX"
  touch "$WINEPREFIX/.complete"
}

# Boots the prefix and keeps its server running until the script ends, so that programs start at once. The server may be
# running already. It ends with its last program, so a program waits here for its standard input to close, which happens
# when the script ends.
wine_start() {
  "$root/scripts/setup" wine
  wine_make_prefix
  coproc wine_client { exec wine cmd >/dev/null 2>&1; }
  wine wineboot >/dev/null 2>&1 </dev/null || fail "Wine cannot boot its prefix in $WINEPREFIX"
}

# windows_path PATH: prints the path for Windows programs. The file need not exist.
windows_path() {
  local path
  path=$(realpath --no-symlinks --canonicalize-missing -- "$1")
  printf 'Z:%s\n' "${path//\//\\}"
}
