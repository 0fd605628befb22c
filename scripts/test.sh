#!/usr/bin/env bash
# Sets up, builds and runs every test.
#   scripts/test.sh              the suite on the release build
#   scripts/test.sh --sanitize   the suite again under AddressSanitizer + UBSan
#   scripts/test.sh --tsan       the suite under ThreadSanitizer
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/install-deps.sh
bash scripts/build.sh "$@"

dir=build
case "${1:-}" in
	--sanitize) dir=build-asan ;;
	--tsan) dir=build-tsan ;;
esac
cd "$dir"
ctest --output-on-failure -j "$(nproc)" --timeout 600
