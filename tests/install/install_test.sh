#!/usr/bin/env bash
# Installs the build into a prefix, moves the prefix away and uses it from there only: the
# installed quillmap annotates the bundled example, and examples/host is built against the
# prefix with find_package(lun) and run. Also checks the library's SONAME, the tool's relative
# RPATH, lun.pc and that every installed header compiles on its own.
#   install_test.sh BUILD_DIR SOURCE_DIR [CMAKE_ARGS for the example host...]
set -euo pipefail
build=$1 src=$2
shift 2
work=$build/test-install
rm -rf "$work"
mkdir -p "$work"
fail() { echo "FAILED: $*" >&2; exit 1; }

cmake --install "$build" --prefix "$work/staged" >/dev/null
# Moved: nothing may point back to where it was installed, to the build or to the sources.
mv "$work/staged" "$work/prefix"
prefix=$work/prefix
libdir=$(cd "$prefix" && dirname "$(find . -name 'liblun.so.*.*.*')")

soname=$(readelf -d "$prefix/$libdir"/liblun.so | sed -n 's/.*(SONAME).*\[\(.*\)\]/\1/p')
[ "$soname" = liblun.so.0 ] || fail "SONAME is '$soname'"
readelf -d "$prefix/bin/quillmap" | grep >/dev/null 'R.*PATH.*\$ORIGIN' || fail "quillmap has no \$ORIGIN run path"

# The installed quillmap, from a folder of its own, with the example copied beside it.
mkdir "$work/run"
cp "$src"/examples/blinky/blinky.json "$src"/examples/blinky/blinky.ucf "$work/run"
cd "$work/run"
unset LUN_DATA_DIR LD_LIBRARY_PATH
version=$("$prefix/bin/quillmap" --version | sed -n 's/.*(liblun \(.*\))$/\1/p')
[ -n "$version" ] || fail "quillmap --version names no library version"
"$prefix/bin/quillmap" annotate blinky.json --ucf blinky.ucf --aul -o blinky.qdf
"$prefix/bin/quillmap" dump blinky.qdf -o dump.txt
grep -q '"LOC" string "P10"' dump.txt || fail "the installed quillmap attached no LOC"
# Its data files are the prefix's: without them, the message names the prefix's data folder.
mv "$prefix/share/lun" "$work/data-away"
"$prefix/bin/quillmap" annotate blinky.json --ucf blinky.ucf --aul 2>err.txt && fail "annotated without ucf.pfd"
grep -q "'ucf.pfd' not found (also looked in '$(realpath -m "$prefix/share/lun")')" err.txt || fail "$(cat err.txt)"
mv "$work/data-away" "$prefix/share/lun"

# Every installed header compiles on its own with only the prefix's include folder, and none
# needs simdjson or SQLite.
inc=$prefix/include/lun
! grep -rlE '#include *<(simdjson|sqlite3)' "$inc" || fail "an installed header includes simdjson or SQLite"
for header in $(cd "$inc" && find . -name '*.h' | sort); do
    echo "#include \"${header#./}\"" | c++ -std=c++20 -fsyntax-only -I"$inc" -x c++ - || fail "$header"
done

if command -v pkg-config >/dev/null; then
    export PKG_CONFIG_PATH=$prefix/$libdir/pkgconfig
    [ "$(pkg-config --modversion lun)" = "$version" ] || fail "lun.pc has another version"
    [ -f "$(pkg-config --variable=includedir lun)/manager/lunmgr.h" ] || fail "lun.pc names no include folder"
fi

# The example host, built against the moved prefix.
cmake -S "$src/examples/host" -B "$work/host" -DCMAKE_PREFIX_PATH="$prefix" "$@" >/dev/null
cmake --build "$work/host" >/dev/null
status=0
"$work/host/lun_host" blinky.json blinky.ucf >host.txt 2>host_err.txt || status=$?
[ "$status" = 1 ] || fail "lun_host exited with $status"  # the UCF names a missing net
grep -q "Could not find net(s) 'dbg_probe'" host_err.txt || fail "$(cat host_err.txt)"
grep -A3 -x 'network clk' host.txt | grep -x >/dev/null '  LOC = P10' || fail "$(cat host.txt)"
grep -A5 -x 'block blinky_TIMESPEC_UCF' host.txt | grep >/dev/null '^    TS_clk = PERIOD' || fail "lun_host printed no TIMESPEC entry"
rm -rf "$work"
echo "install: passed"
