#!/bin/sh
# Every exported header compiles by itself, twice in a row, as C and as C++.
#   headers_alone.sh CC CXX INCLUDE_FOLDER HEADER...
# A header for C++ alone says so in C, by its own #error.
set -eu
cc=$1
cxx=$2
include=$3
shift 3
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
status=0
# Headers for C++ may show the JSON values of jsoncpp.
json=$(pkg-config --cflags jsoncpp)

compiles() { # COMPILER STANDARD LANGUAGE
    # shellcheck disable=SC2086 # a list of words
    "$1" -std="$2" -x "$3" -I "$include" $json -Wall -Wextra -Wpedantic -Werror -fsyntax-only \
        "$work/source" >"$work/messages" 2>&1
}

fail() {
    echo "$header as $1:"
    cat "$work/messages"
    status=1
}

for header; do
    # The declaration is there because a source that holds nothing is no C.
    printf '#include <%s>\n#include <%s>\nextern int theEnd;\n' "$header" "$header" \
        >"$work/source"
    if grep -q '^#error "C++ only"$' "$include/$header"; then
        if compiles "$cc" c11 c || ! grep -q 'C++ only' "$work/messages"; then
            fail "C, which it should refuse"
        fi
    else
        compiles "$cc" c11 c || fail c11
    fi
    for standard in c++17 c++20; do
        compiles "$cxx" $standard c++ || fail $standard
    done
done
exit $status
