#!/bin/sh
# Builds libvorelix against an installed platform library, as for a device whose maker ships it,
# and installs it into a library folder of an architecture.
# Takes BUILD, SOURCE, WORK, ROOT, LIBDIR, CMAKE, NM, CC, CXX, FLAGS by their names.
set -eu

rm -rf "$WORK"
mkdir -p "$WORK"
"$CMAKE" --install "$BUILD" --prefix "$WORK/platform" >"$WORK/install.log"
"$CMAKE" -S "$SOURCE/../.." -B "$WORK/build" -DVORELIX_PLATFORM=external \
    -DVORELIX_PROGRAMS=OFF -DZANO_ROOT="$ROOT" -DCMAKE_PREFIX_PATH="$WORK/platform" \
    -DCMAKE_INSTALL_LIBDIR=lib/architecture \
    -DCMAKE_C_COMPILER="$CC" -DCMAKE_CXX_COMPILER="$CXX" -DVORELIX_SANITIZE="$SANITIZE" \
    >"$WORK/configure.log"
"$CMAKE" --build "$WORK/build" >"$WORK/build.log"
sh "$SOURCE/exported_names.sh" "$NM" "$SOURCE/exported_names.txt" "$WORK/build/libvorelix.so"

"$CMAKE" --install "$WORK/build" --prefix "$WORK/installed" >"$WORK/install.log"
export PKG_CONFIG_PATH="$WORK/installed/lib/architecture/pkgconfig:$WORK/platform/$LIBDIR/pkgconfig"
# What pkg-config prints is quoted for a shell.
eval "includedir=$(pkg-config --variable=includedir vorelix)"
eval "libdir=$(pkg-config --variable=libdir vorelix)"
test -f "$includedir/vorelix/vorelix.h"
test -e "$libdir/libvorelix.so"
