#!/bin/sh
# The names that the shared libraries export: libvorelix exactly those of the list, the platform
# nothing of its inside.
#   exported_names.sh NM LIST LIBVORELIX [LIBZANOPLATFORM]
set -eu
export LC_ALL=C
nm=$1
list=$2

names() {
    "$nm" -D --defined-only -C "$1" | sed -E 's/^[0-9a-f]+ [A-Za-z] //' | sort -u
}

status=0
names "$3" | diff -u "$list" - || status=1

if [ $# -gt 3 ]; then
    pattern='^((ZANO|KLIB|MediaInfoDB|ParsePlayList|VolumePathParse)[A-Za-z0-9]*$|(ZanoConf|WebMan|SDK::User)::)'
    if ! names "$4" | grep -qE "$pattern"; then
        echo "$4 exports nothing"
        status=1
    fi
    if names "$4" | grep -vE "$pattern"; then
        echo "these names of $4 are not the platform's interface"
        status=1
    fi
fi
exit $status
