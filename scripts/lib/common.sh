# What every script of the project starts with: strict mode, the project's root folder, and how a script
# speaks. Progress and errors go to standard error, so that standard output stays what a script delivers.
# shellcheck shell=bash
set -euo pipefail

root=$(CDPATH='' cd -- "$(dirname -- "${BASH_SOURCE[0]}")/../.." && pwd)

# progress TEXT: one line for a stage that takes time.
progress() { printf '== %s\n' "$*" >&2; }

# fail TEXT: one clear sentence, and the end of the script.
fail() {
  printf '%s: %s\n' "${0##*/}" "$*" >&2
  exit 1
}

# takes_no_arguments "$@": ends a script that has got some.
takes_no_arguments() { [[ $# -eq 0 ]] || fail "'$1' is one argument too many, see scripts/${0##*/} --help"; }

# help_if_asked "$@": prints the comment that opens the calling script when its first argument asks for help.
help_if_asked() {
  case ${1-} in
    -h | --help)
      awk 'NR > 1 { if (!/^#/) exit; sub(/^# ?/, ""); print }' "$0"
      exit 0
      ;;
  esac
}
