#!/bin/sh
# Serves the demo music with lighttpd and webapi on a free port of the loopback, as ./run does, and runs
# the tests of the page in Chromium.
# Takes SOURCE (of the project), ROOT (the root that the programs see), WORK (a folder for what is made) and the
# programs WEBAPI, ZANOINDEX, CONFMIMETYPE by their names. Arguments are the tests to run, or none for all.
set -eu

tests=$SOURCE/tests/browser
PATH=$PATH:/usr/sbin
fail() {
    printf 'browser tests: %s\n' "$*" >&2
    exit 1
}
for program in chromium node npm lighttpd ffmpeg; do
    command -v "$program" >/dev/null || fail "$program is missing; scripts/dependencies test installs it"
done
mkdir -p "$WORK/npm" "$ROOT/var/services" "$ROOT/usr/zano/etc" "$ROOT/usr/zano/bin" "$ROOT/tmp"

# What is installed already need not be fetched again.
if ! cmp -s "$tests/package-lock.json" "$WORK/npm/installed.json"; then
    rm -f "$WORK/npm/installed.json"
    cp "$tests/package.json" "$tests/package-lock.json" "$WORK/npm/"
    (cd "$WORK/npm" && npm ci --no-audit --no-fund --ignore-scripts) >"$WORK/npm.log" 2>&1 || {
        cat "$WORK/npm.log" >&2
        fail "npm could not install playwright-core; the tests need the npm registry once"
    }
    cp "$tests/package-lock.json" "$WORK/npm/installed.json"
fi

music=$WORK/music
server=
clean_up() {
    [ -z "$server" ] || { kill "$server" && wait "$server"; } 2>/dev/null || :
    rm -f "$ROOT/var/services/music" "$ROOT/usr/zano/etc/zano.conf" "$ROOT/usr/zano/bin/confmimetype" \
        "$ROOT/tmp/mimetype.tmp"
}
trap clean_up EXIT
trap 'exit 1' HUP INT TERM

"$SOURCE/scripts/make-demo-music" "$music"
rm -rf "$music/playlists"
rm -f "$WORK"/media.db*
ln -sfn -- "$music" "$ROOT/var/services/music"
ln -sfn -- "$CONFMIMETYPE" "$ROOT/usr/zano/bin/confmimetype"
printf 'mediadb="sqlite:%s"\nrunvorelix="yes"\n' "$WORK/media.db" >"$ROOT/usr/zano/etc/zano.conf"
"$ZANOINDEX" "$music"

export VORELIX_USER=admin VORELIX_WEBAPI="$WEBAPI" VORELIX_PAGE="$SOURCE/programs/webapi/page" \
    VORELIX_ERRORS="${WEBAPI%/*}/errors" VORELIX_PORT
VORELIX_PORT=$(node -e 'const s = require("net").createServer().listen(0, "127.0.0.1", () => {
    console.log(s.address().port); s.close(); })')
lighttpd -D -f "$SOURCE/programs/webapi/lighttpd/local.conf" 2>"$WORK/lighttpd.log" &
server=$!

export VORELIX_URL="http://127.0.0.1:$VORELIX_PORT/" VORELIX_NODE_FOLDER="$WORK/npm/" VORELIX_CHROMIUM
VORELIX_CHROMIUM=$(command -v chromium)
[ $# -gt 0 ] || set -- "$tests"/*_test.mjs
status=0
node --test --test-concurrency=1 "$@" || status=$?
[ "$status" -eq 0 ] || { echo "lighttpd's log:"; cat "$WORK/lighttpd.log"; } >&2
exit "$status"
