#!/usr/bin/env bash
# Makes docs/editor.png, the README's picture of the editor: a private Xvfb, the editor opened on
# a scratch copy of data/ with sample_large, its light icons and the selected light's falloff
# sphere showing, a picture of the whole window once the frames have settled.
#   scripts/editor-screenshot.sh [OUT.png]
set -euo pipefail
cd "$(dirname "$0")/.."
out="$(realpath -m "${1:-docs/editor.png}")"

bash scripts/install-deps.sh
bash scripts/build.sh
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cp -r data "$scratch/data"
# A settings folder of its own: the picture does not depend on this user's saved layout.
export XDG_CONFIG_HOME="$scratch/config"
export LUMORA_CLI="$PWD/build/tools/lumora/lumora"
DISPLAY= bash app/tests/run-under-xvfb.sh ./build/app/lumora-editor --data "$scratch" --size 1600x900 \
	--select point-light:4 --screenshot "$out" sample_large
echo "wrote $out"
