#!/usr/bin/env bash
# The main job: until the desktop demo host exists, show what the command-line
# tool offers.
set -euo pipefail
BUILD=${1:-build}
"$BUILD/apps/belvane/belvane" --help
