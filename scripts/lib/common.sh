# Every script of the project sources this first: strict mode, the project's root folder, and functions for messages.
# Progress and errors go to standard error, so that standard output has only the script's result.
# shellcheck shell=bash
set -euo pipefail
trap 'exit 130' INT # Ctrl-C ends the script, even if the program that it interrupts ends as if all were well

root=$(CDPATH='' cd -- "$(dirname -- "${BASH_SOURCE[0]}")/../.." && pwd)

# progress TEXT: announces a stage that takes time, in one line.
progress() {
  stage=$*
  printf '== %s\n' "$stage" >&2
}

# patiently COMMAND...: runs a command that may take minutes. Until it ends, prints a line every `seconds_between_lines`
# seconds to show that the stage is still running.
seconds_between_lines=20
patiently() {
  local ticker status=0
  exec {ticker}> >(tick)
  "$@" {ticker}>&- || status=$?
  exec {ticker}>&-
  return "$status"
}

# logged FILE COMMAND...: runs a command and appends its output to a file. Redirecting `patiently` itself would redirect
# its lines too.
logged() { "${@:2}" >>"$1" 2>&1; }

# tick: prints the lines of `patiently` until its standard input closes, which also happens if the script is killed.
tick() {
  local start=$SECONDS status
  while
    status=0
    read -rt "$seconds_between_lines" || status=$?
    [[ $status -gt 128 ]] # timeout
  do
    printf '   %s: %s s so far\n' "$stage" $((SECONDS - start)) >&2
  done
}

# fail TEXT: prints one clear sentence and ends the script.
fail() {
  printf '%s: %s\n' "${0##*/}" "$*" >&2
  exit 1
}

# takes_no_arguments "$@": ends the script if it has any arguments.
takes_no_arguments() { [[ $# -eq 0 ]] || fail "unexpected argument '$1', see scripts/${0##*/} --help"; }

# help_if_asked "$@": prints the opening comment of the calling script and ends it, if its first argument is -h or --help.
help_if_asked() {
  case ${1-} in
    -h | --help)
      awk 'NR > 1 { if (!/^#/) exit; sub(/^# ?/, ""); print }' "$0"
      exit 0
      ;;
  esac
}
