#!/usr/bin/env bash
# Installs every Debian package Lumora needs to build, test and run.
# Idempotent: when everything is present it changes nothing and asks no mirror.
set -euo pipefail

PACKAGES=(
	# toolchain
	g++ cmake ninja-build pkg-config clang-format
	# GCC's libbacktrace for call stacks in fatal reports
	libgcc-12-dev
	# XML files
	libtinyxml-dev
	# the bake record: JSON, and XXH3-128 content hashes of a bake's inputs
	nlohmann-json3-dev libxxhash-dev
	# the command line tool's argument parsing
	libcli11-dev
	# tests and benchmarks (the tests use GoogleMock's matchers, header-only)
	googletest libgtest-dev libgmock-dev libbenchmark-dev
	# the libFuzzer build of the file readers (cmake -DLUMORA_FUZZ=ON with clang)
	clang
	# GPU layer: OpenGL through libepoxy on EGL, Mesa's llvmpipe for headless runs, PNG output
	libepoxy-dev libegl-dev libgl1-mesa-dri libegl-mesa0 libpng-dev
	# windows to present into (X11), and a virtual X server for the window tests
	libx11-dev xvfb
	# the desktop editor: Qt 6 Widgets and Qt Test (its window tests run under Xvfb)
	qt6-base-dev
	# the Python module (pybind11 over the library, built for Debian's /usr/bin/python3), its
	# tests (pytest, NumPy) and the bakes spread over a Dask cluster
	python3-dev pybind11-dev python3-numpy python3-pytest python3-dask python3-distributed
	# screen text: fontconfig finds families, FreeType rasterises; Liberation stands in for Arial
	libfontconfig-dev libfreetype-dev fonts-liberation
)

missing=()
for package in "${PACKAGES[@]}"; do
	if ! dpkg-query -W -f='${Status}' "$package" 2>/dev/null | grep -q "install ok installed"; then
		missing+=("$package")
	fi
done

if [ ${#missing[@]} -eq 0 ]; then
	echo "install-deps: all ${#PACKAGES[@]} packages present"
	exit 0
fi

SUDO=""
if [ "$(id -u)" -ne 0 ]; then
	SUDO="sudo"
fi
echo "install-deps: installing ${missing[*]}"
$SUDO apt-get update -qq
DEBIAN_FRONTEND=noninteractive $SUDO apt-get install -y -qq --no-install-recommends "${missing[@]}"
