# The Wine in which Windows programs of the project run: a prefix of its own in the build folder, quiet, and
# without anything that would reach into the user's desktop. A script that needs another prefix names it in
# QEL_WINEPREFIX before it sources this.
# shellcheck shell=bash
. "$(dirname "${BASH_SOURCE[0]}")/common.sh"

export WINEPREFIX=${QEL_WINEPREFIX-$root/build/wine}
export WINEARCH=win64
export LC_ALL=C.UTF-8 # in another character set Wine mangles the letters of paths
export WINEDEBUG=-all
# No .NET, no HTML engine, no debugger window on a fault, no menu entries for registered file types, no Wayland.
export WINEDLLOVERRIDES="mscoree,mshtml,winedbg.exe,winemenubuilder.exe,winewayland.drv="

# Pipes are closed, as Wine's services inherit them and would keep whoever reads them waiting.
wine_boot() { wine wineboot "$@" >/dev/null 2>&1 </dev/null && wineserver -w; }

# wine_alone "$@": starts the calling script again as the only one that changes the prefix, since several register the
# extension in it. What a script leaves behind does not keep the lock.
wine_alone() {
  [[ ${QEL_ALONE_IN-} != "$WINEPREFIX" ]] || return 0
  mkdir -p "$root/build"
  local lock=$WINEPREFIX.lock
  flock --nonblock "$lock" true || progress "Waiting for another script that uses Wine"
  QEL_ALONE_IN=$WINEPREFIX exec flock --close "$lock" "$0" "$@"
}

# Makes the prefix if there is none yet.
wine_make_prefix() {
  [[ ! -f $WINEPREFIX/.complete ]] || return 0
  "$root/scripts/setup" wine
  progress "Making a Wine prefix"
  mkdir -p "$WINEPREFIX"
  # Rarely the first boot of a new prefix fails; the second one then completes it.
  patiently wine_boot --init || patiently wine_boot --init || fail "Wine cannot make its prefix in $WINEPREFIX"
  touch "$WINEPREFIX/.complete"
}

# Boots the prefix and keeps its server until the script ends, so that programs start at once. A server that already
# runs serves as well. It runs as long as a program does: here one that waits for the end of its standard input, which
# comes with the end of the script.
wine_start() {
  "$root/scripts/setup" wine
  wine_make_prefix
  coproc wine_client { exec wine cmd >/dev/null 2>&1; }
  wine wineboot >/dev/null 2>&1 </dev/null || fail "Wine cannot boot its prefix in $WINEPREFIX"
}

# windows_path PATH: the path under which Windows programs find it, whether it exists or not.
windows_path() {
  local path
  path=$(realpath --no-symlinks --canonicalize-missing -- "$1")
  printf 'Z:%s\n' "${path//\//\\}"
}
