#!/usr/bin/env bash
# Which lines and branches of the library and the command no test runs.
#
#   coverage.sh           builds preset `coverage`, runs the tests there, and reports
#   coverage.sh report    reports on what has been run in that build so far
#
# Writes to build/coverage:
#
#   files.tsv       lines and branches, in all and run, of each file
#   left_out.tsv    each line that is not run, and whether tests/trust/lines_that_no_test_can_run.tsv has a reason for it;
#                   each decision of which not all outcomes are taken
#
# and to tests/trust/coverage.tsv the same figures of kvt/ and of tools/. coverage.py says what counts.

set -euo pipefail
export LC_ALL=C.UTF-8
cd -- "$(dirname -- "${BASH_SOURCE[0]}")/../.."

folder=build/coverage

# These compile, look at files, or copy an installation: they run nothing that is counted.
uncounted='Header|CompileFail|NaturalLines\.compile|Consumer|Gdb|Exports|Mutations|Readme|Hardening|Includes|IncludesOf|TrustPage'
# These feed gigabytes, or kill what they start, which then counts nothing.
unbounded='HostileInput|KvtKilled|KilledChild|UStringGuaranteeDeathTest|RealTables|Cluster'
# These compare with a second implementation over all there is, or from many seeds, which takes long where nothing is
# optimised. A part of their cases runs the same lines.
exhaustive='Shard/ConversionTables|Each/UnicodeVectors|Shard/IcuDifferential'
exhaustive+='|Shards/PatternAgreement|DamagedZoneFolder|SingleByteTables|Pair/UnicodeDifferential|WwjdDecode'
exhaustive+='|Each/CaseTable|From/FormatAgreement|UStringCaseData|ParseZQTDateTime|FormatRoundTrip'
exhaustive+='|Encoding/TableDifferential|Utf8Check|Conformance.*'
seeds='Part/FloatTextSample\..*/[1-7]|Seeds/MatchesModel\..*/[1-3]'

run_tests() {
    local failed=0
    # Where a test limits how long files may be, the counts are cut off as well, which is not to be said among its output.
    export GCOV_ERROR_FILE=/dev/null
    # The inputs that were found and some hundred damaged ones; `./dev fuzz` is for more.
    for fuzzer in "$folder"/fuzz/*_fuzz; do
        name=$(basename -- "$fuzzer" _fuzz)
        "$fuzzer" "fuzz/corpus/$name" --rounds 300 || failed=1
    done
    # The pages that tests read were written during the build, before anything counted.
    "$folder/tools/kvt/kvt_pages" "$folder/written_pages" 0 2000-01-01 || failed=1
    ctest --preset coverage -j "$(nproc)" --timeout 1800 --output-log "$folder/tests.log" \
        -E "^((Fuzz|$uncounted|$unbounded|$exhaustive)(\.|\$)|$seeds)" || failed=1
    GTEST_TOTAL_SHARDS=8 GTEST_SHARD_INDEX=0 ctest --preset coverage -j "$(nproc)" --timeout 1800 \
        --output-log "$folder/parts_of_tests.log" -R "^($exhaustive)(\.|\$)" || failed=1
    return "$failed"
}

failed=0
if [[ ${1:-} != report ]]; then
    cmake --preset coverage --log-level=WARNING >&2
    cmake --build --preset coverage >&2
    find "$folder" -name '*.gcda' -delete
    run_tests >&2 || failed=1
fi
python3 tests/house/coverage.py "$folder"
cat tests/trust/coverage.tsv
if [[ $failed -ne 0 ]]; then
    echo "coverage: a test fails, so that the figures are too low" >&2
    exit 1
fi
