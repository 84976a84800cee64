#!/bin/sh
# Installs the tree, moves it away, and lists songs with programs that were built against it from
# outside: with pkg-config and with find_package.
# Takes BUILD, SOURCE, WORK, ROOT, LIBDIR, CMAKE, MAKE_CATALOGUE, CC, CXX, FLAGS by their names.
set -eu

conf=$ROOT/usr/zano/etc/zano.conf
link=$ROOT/var/services/music
rm -rf "$WORK"
mkdir -p "$WORK" "${conf%/*}" "${link%/*}"
trap 'rm -f "$conf" "$link"' EXIT

"$MAKE_CATALOGUE" "sqlite:$WORK/media.db"
printf 'mediadb="sqlite:%s"\n' "$WORK/media.db" >"$conf"
rm -f "$link"
ln -s /volume1/music "$link"

"$CMAKE" --install "$BUILD" --prefix "$WORK/installed" >"$WORK/install.log"
prefix=$WORK/moved
mv "$WORK/installed" "$prefix"

mkdir "$WORK/pkg-config"
export PKG_CONFIG_PATH="$prefix/$LIBDIR/pkgconfig"
# What pkg-config prints is quoted for a shell, so that a folder's name may hold a space.
eval "set -- $(pkg-config --cflags --libs vorelix)"
# shellcheck disable=SC2086 # a list of words
{
    "$CC" -std=c11 $FLAGS "$SOURCE/consumer/list.c" -o "$WORK/pkg-config/list_c" \
        "$@" "-Wl,-rpath,$prefix/$LIBDIR"
    "$CXX" -std=c++17 $FLAGS "$SOURCE/consumer/list.cpp" -o "$WORK/pkg-config/list_cpp" \
        "$@" "-Wl,-rpath,$prefix/$LIBDIR"
}

"$CMAKE" -S "$SOURCE/consumer" -B "$WORK/find_package" -DCMAKE_PREFIX_PATH="$prefix" \
    -DCMAKE_C_COMPILER="$CC" -DCMAKE_CXX_COMPILER="$CXX" \
    -DCMAKE_C_FLAGS="$FLAGS" -DCMAKE_CXX_FLAGS="$FLAGS" >"$WORK/configure.log"
"$CMAKE" --build "$WORK/find_package" >"$WORK/build.log"

for way in pkg-config find_package; do
    "$WORK/$way/list_c" >"$WORK/listed"
    diff -u - "$WORK/listed" <<'END'
3 songs listed, 3 counted
Björk: Army of Me
Motörhead: Bomber's
Motörhead: Overkill
END
    "$WORK/$way/list_cpp" motorhead >"$WORK/found"
    diff -u - "$WORK/found" <<'END'
1980 Bomber's
1979 Overkill
END
done
