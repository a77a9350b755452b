#!/usr/bin/env bash
# Installs the Debian packages the build, the tests, the fuzzers (clang and its sanitizer and
# libFuzzer runtimes) and the examples need, when missing.
set -euo pipefail
packages=(g++ clang libclang-rt-dev cmake ninja-build libsimdjson-dev libcli11-dev libsqlite3-dev sqlite3 libgtest-dev
          libgmock-dev libbenchmark-dev yosys help2man dpkg-dev file pkgconf
          chromium)
missing=()
for p in "${packages[@]}"; do
    dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing+=("$p")
done
if ((${#missing[@]})); then
    echo "installing: ${missing[*]}"
    sudo_cmd=""
    [ "$(id -u)" -ne 0 ] && sudo_cmd="sudo"
    $sudo_cmd apt-get update -qq
    DEBIAN_FRONTEND=noninteractive $sudo_cmd apt-get install -y -qq "${missing[@]}" >/dev/null
fi
