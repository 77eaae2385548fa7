#!/usr/bin/env bash
# The daemon links a device's SDK, whose libubox is found inside it alone: sdk_test.sh LIBRARIES FOLDER [TOOLCHAIN]
# LIBRARIES holds the stand-ins, which play the SDK's libraries in FOLDER; TOOLCHAIN is the file of a cross build.
set -euo pipefail
libraries=$1 folder=$2 toolchain=${3:-}
source=$(cd "$(dirname "$0")/../.." && pwd)

configure() {
    cmake -S "$source" -B "$folder/build" -G Ninja -DCMAKE_TOOLCHAIN_FILE="$toolchain" -DKIV_SDK_DIR="$folder/sdk" \
        -DKIV_BUILD_TESTS=OFF -DKIV_BUILD_SIMULATOR=OFF
}

rm -rf "$folder"
mkdir -p "$folder/sdk/lib" "$folder/sdk/include/libubox"
cp -L "$libraries"/libkiv*.so.1 "$folder/sdk/lib"

if configure >"$folder/without.log" 2>&1; then
    echo "an SDK without libubox was taken"
    exit 1
fi
if ! grep -q 'KIV_SDK_DIR: .*libubox' "$folder/without.log"; then
    cat "$folder/without.log"
    exit 1
fi

cp -L "$libraries/libubox.so" "$folder/sdk/lib/libubox.so"
cp "$source/platform/standin/ubox/libubox/uloop.h" "$folder/sdk/include/libubox"
configure
cmake --build "$folder/build" --target kiv_mirta_led
needed=$(readelf -d "$folder/build/kiv_mirta_led")
grep -q 'NEEDED.*libubox' <<<"$needed"
grep -q "RUNPATH.*$folder/sdk/lib" <<<"$needed"
