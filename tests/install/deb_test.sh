#!/usr/bin/env bash
# Packs the build with `cpack -G DEB` and checks the package: the tool, the library, the
# headers, the CMake package, the data files and the manual page, and its runtime
# dependencies on simdjson and SQLite.
#   deb_test.sh BUILD_DIR
set -euo pipefail
build=$1
work=$build/test-deb
rm -rf "$work"
mkdir -p "$work"
fail() { echo "FAILED: $*" >&2; exit 1; }

(cd "$build" && cpack -G DEB -B "$work" >"$work/cpack.log") || fail "$(cat "$work/cpack.log")"
deb=$(ls "$work"/*.deb)
dpkg-deb -c "$deb" | awk '{print $6}' >"$work/files.txt"
for file in ./usr/bin/quillmap './usr/lib/.*liblun\.so\.0\.1\.0' ./usr/include/lun/manager/lunmgr.h \
            ./usr/include/lun/host/port/version.h './usr/lib/.*cmake/lun/lunConfig\.cmake' \
            ./usr/share/lun/ucf.pfd ./usr/share/lun/ucf.prp; do
    grep -qx "$file" "$work/files.txt" || fail "$deb has no $file"
done
if grep -q '^HELP2MAN:FILEPATH=/' "$build/CMakeCache.txt"; then
    grep -qx './usr/share/man/man1/quillmap.1' "$work/files.txt" || fail "$deb has no manual page"
fi
depends=$(dpkg-deb -f "$deb" Depends)
for lib in libsimdjson libsqlite3; do
    [[ $depends == *$lib* ]] || fail "the package does not depend on $lib: $depends"
done
rm -rf "$work"
echo "deb: passed"
