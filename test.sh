#!/bin/bash
# SPDX-License-Identifier: Apache-2.0
# Builds everything and runs every test, in the release build and under AddressSanitizer and
# UndefinedBehaviorSanitizer. The last line counts the tests that passed and failed.
set -euo pipefail
cd "$(dirname "$0")"

usage() {
    cat <<'EOF'
Usage: ./test.sh [OPTIONS]

  --fast         run only the unit tests, in the debug build: for the edit loop
  --long         run random and repeated tests at full length: takes minutes longer
  --no-install   do not install missing packages
  --jobs N       number of parallel compilations and tests (default: one per processor)
  --help         print this help

Exit status: 0 if every test passed, 1 otherwise, 2 for a usage error.
EOF
}

# The test that reads each of these counts documents it beside its default. A count that is already set stays.
lengthen() {
    timeout=7200
    local count
    for count in DVS_CODEC_COUNT=100000 DVS_HOSTILE_VALUES=1000000 DVS_KILL_ROUNDS=200 DVS_FAULT_STEP=1 \
        DVS_LENGTH_FILLS=20 DVS_ROUND_TRIPS=1000 DVS_TEST_HOSTILE_REPLIES=10000 DVS_TEST_HOSTILE_REQUESTS=10000 \
        DVS_TEST_KILLED_CLIENTS=200 DVS_TEST_MUTATIONS=100000 DVS_TEST_RESTARTS=50 DVS_TEST_SAVES=1000 \
        DVS_TEST_THREAD_SECONDS=30 STORE_FAULT_STEP=1 STORE_FLIP_ROUNDS=2000 STORE_HOSTILE_MB=100 \
        STORE_KILL_ROUNDS=200 STORE_MEMORY_STEP=1 STORE_ORACLE_ROUNDS=100000 STORE_RACE_SAVES=300; do
        [ -v "${count%%=*}" ] || export "${count?}"
    done
}

presets=(release asan)
label=()
install=yes
timeout=300
jobs=$(nproc)
while [ $# -gt 0 ]; do
    case $1 in
    --fast) presets=(debug) label=(-L unit) ;;
    --long) lengthen ;;
    --no-install) install=no ;;
    --jobs) jobs=${2:?--jobs requires a number} && shift ;;
    --help | -h) usage && exit 0 ;;
    *) usage >&2 && exit 2 ;;
    esac
    shift
done

[ "$install" = no ] || cmake/install-packages.sh

passed=0
failed=0
skipped=0
summary=
for preset in "${presets[@]}"; do
    echo "== $preset: build"
    cmake --preset "$preset" -DDVS_WERROR=ON -DDVS_TEST_TIMEOUT="$timeout" >/dev/null
    cmake --build --preset "$preset" --parallel "$jobs" -- --quiet
    echo "== $preset: test"
    report=build/$preset/test-results.xml
    rm -f "$report"
    # Show only failures; the report has the rest.
    ctest --preset "$preset" --parallel "$jobs" --output-junit "$PWD/$report" "${label[@]}" |
        grep -vE '^ *(Start +[0-9]+:|[0-9]+/[0-9]+ Test .* Passed |$)' || true
    count() { tr '\n\t' '  ' <"$report" | grep -o '<testsuite [^>]*>' | grep -oE " $1=\"[0-9]+\"" | grep -oE '[0-9]+'; }
    [ -s "$report" ] && total=$(count tests) && [ "$total" -gt 0 ] || { echo "No test ran in $preset" >&2; exit 1; }
    bad=$(($(count failures) + $(count disabled)))
    skipped=$((skipped + $(count skipped)))
    total=$((total - $(count skipped)))
    passed=$((passed + total - bad))
    failed=$((failed + bad))
    summary="$summary, $preset $((total - bad)) of $total"
done

echo
[ "$skipped" -eq 0 ] || echo "$skipped tests were skipped on this machine; their output gives the reason."
echo "Tests: $passed passed, $failed failed (${summary#, })"
[ "$failed" -eq 0 ]
