#!/usr/bin/env bash
# Plants the faults of tools/faults.list one at a time in a scratch copy of a source tree, rebuilds,
# runs the tests the fault reaches and reports which faults the suite catches.
#
#   tools/plant-faults.sh [--source DIR] [--list FILE] [--only id,id] [--report FILE] [--name NAME]
#                         [--jobs N] [--all-tests] [--no-verify] [--check]
#
# Run `tools/plant-faults.sh --help` for the options.
set -euo pipefail
here=$(cd "$(dirname "$0")" && pwd)
exec python3 "$here/plant-faults.py" --tool-dir "$here" "$@"
