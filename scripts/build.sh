#!/usr/bin/env bash
# Configures and builds Lumora out of source.
#   scripts/build.sh              release build with debug info in build/
#   scripts/build.sh --sanitize   AddressSanitizer + UBSan build in build-asan/
#   scripts/build.sh --tsan       ThreadSanitizer build in build-tsan/
# Under CI=true warnings are errors.
set -euo pipefail
cd "$(dirname "$0")/.."

dir=build
options=()
case "${1:-}" in
	--sanitize) dir=build-asan; options+=(-DLUMORA_SANITIZE=ON -DLUMORA_ASSERTIONS=ON -DLUMORA_BUILD_BENCH=OFF) ;;
	--tsan) dir=build-tsan; options+=(-DLUMORA_TSAN=ON -DLUMORA_BUILD_BENCH=OFF) ;;
	"") ;;
	*) echo "usage: $0 [--sanitize|--tsan]" >&2; exit 2 ;;
esac
if [ "${CI:-}" = "true" ]; then
	options+=(-DLUMORA_WERROR=ON)
fi

# The Python module is built for Debian's interpreter, whose packages (NumPy, Dask, pytest) the
# install script puts in place; another python3 earlier on the PATH would lack them.
if [ -x /usr/bin/python3 ]; then
	options+=(-DPython3_EXECUTABLE=/usr/bin/python3)
fi
cmake -S . -B "$dir" -G Ninja -DCMAKE_BUILD_TYPE=RelWithDebInfo "${options[@]}"
cmake --build "$dir" -j "$(nproc)"
