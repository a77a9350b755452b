#!/usr/bin/env bash
# Builds quillmap and annotates the bundled example design with its constraint file.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/deps.sh
cmake -S . -B build/release -G Ninja -DCMAKE_BUILD_TYPE=RelWithDebInfo >/dev/null
cmake --build build/release -j"$(nproc)" --target quillmap
q=build/release/quillmap
ex=examples/blinky
echo "== quillmap annotate $ex/blinky.json --ucf $ex/blinky.ucf --aul -o build/blinky.qdf"
$q annotate $ex/blinky.json --ucf $ex/blinky.ucf --aul -o build/blinky.qdf
echo "== quillmap extract build/blinky.qdf"
$q extract build/blinky.qdf
