#!/bin/sh
# Foreign C interfaces are included in their wrapper and nowhere else, so that what they need is
# done in one place.   wrappers.sh SOURCE_FOLDER
set -eu
cd "$1"
status=0

# HEADER PLACE: both as extended expressions. A header that nothing includes would mean that its row
# tests nothing.
check() {
    found=$(grep -rnE "^[[:space:]]*#[[:space:]]*include[[:space:]]*[<\"]($1)[>\"]" \
        --include='*.h' --include='*.cpp' --include='*.c' \
        include library playlists config misc users player web upnp ipod platform programs \
        2>/dev/null || true)
    if [ -z "$found" ]; then
        echo "nothing includes $1"
        status=1
    fi
    stray=$(printf '%s' "$found" | grep -vE "^($2)" || true)
    if [ -n "$stray" ]; then
        echo "$stray"
        echo "    belongs in $2"
        status=1
    fi
}

# A program may name itself to the log where it starts.
check 'syslog\.h' 'include/log_internal\.h:|platform/|programs/[a-z]+/main\.cpp:'
check 'sqlite3(ext)?\.h' 'platform/mediadb/sqlite/'
check 'taglib/.*|fileref\.h|tag\.h' 'programs/zanoindex/'
check 'gpod/.*' 'programs/zanoipod/ipod\.cpp:'
check 'utf8proc\.h' 'platform/text/|programs/playlists/text\.cpp:'
check '(postgresql/)?libpq(-fe|/.*)?\.h' 'platform/mediadb/postgresql/'
check 'curl/.*' 'upnp/'
check 'libxml/.*' 'upnp/|programs/upnp/'
check 'miniupnpc/.*' 'programs/upnp/'
exit $status
