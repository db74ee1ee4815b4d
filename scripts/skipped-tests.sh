#!/usr/bin/env bash
# Lists the tests of the last CTest run in a build folder that skipped, each
# with the reason it gave, so that a skip never passes unexplained.
set -euo pipefail
log="${1:?usage: skipped-tests.sh BUILD_DIR}/Testing/Temporary/LastTest.log"
[ -f "$log" ] || { echo "skipped-tests: no test log at $log" >&2; exit 1; }
# GoogleTest prints "file:line: Skipped", the reason, then "[  SKIPPED ] Name".
awk '/: Skipped$/ { reason = ""; collecting = 1; next }
     collecting && /^\[  SKIPPED \]/ { sub(/^\[  SKIPPED \] /, ""); sub(/ \([0-9]+ ms\)$/, "");
                                      print "skipped: " $0 ": " reason; collecting = 0; next }
     collecting { reason = reason (reason == "" ? "" : " ") $0 }' "$log"
