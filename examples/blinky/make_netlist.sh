#!/usr/bin/env bash
# Regenerates blinky.json from blinky.v with Yosys (autoname gives cells readable names
# derived from the signals they drive, such as count_$_SDFF_PP0__Q_3).
set -euo pipefail
cd "$(dirname "$0")"
yosys -q -p "read_verilog blinky.v; synth -top blinky; autoname; write_json blinky.json"
