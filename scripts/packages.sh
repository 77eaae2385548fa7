# Sourced by the commands in the root: installs what this machine lacks, from Debian's packages.
# need_packages PACKAGE... says in one line what it installs, and nothing when all is there.
need_packages() {
    local missing=() package as_root=()
    for package in "$@"; do
        dpkg-query -W -f '${Status}' "$package" 2>/dev/null | grep -q 'ok installed' || missing+=("$package")
    done
    [ ${#missing[@]} -eq 0 ] && return 0
    [ "$(id -u)" -eq 0 ] || as_root=(sudo)
    echo "installing ${missing[*]}"
    if ! { "${as_root[@]}" apt-get update -q && "${as_root[@]}" env DEBIAN_FRONTEND=noninteractive \
        apt-get install -q -y --no-install-recommends "${missing[@]}"; } >"${TMPDIR:-/tmp}/kiv-packages.log" 2>&1; then
        tail -n 5 "${TMPDIR:-/tmp}/kiv-packages.log" >&2
        echo "error: could not install ${missing[*]}" >&2
        return 1
    fi
}

# quietly LOG COMMAND... runs the command with its output in LOG, which is shown when the command fails.
quietly() {
    local log=$1
    shift
    mkdir -p "$(dirname "$log")"
    "$@" >"$log" 2>&1 || { tail -n 60 "$log" >&2; echo "error: $* failed; all of it is in $log" >&2; return 1; }
}

build_packages=(g++ cmake ninja-build libcli11-dev libcpp-httplib-dev libedit-dev nlohmann-json3-dev libgtest-dev libfuse3-dev
    pkg-config python3)
browser_packages=(chromium chromium-driver)
armv7_packages=(g++-arm-linux-gnueabihf qemu-user googletest)

debian_packages=(dpkg-dev file lintian)

# build_preset PRESET TARGET... configures and builds into build/PRESET/.
build_preset() {
    local preset=$1
    shift
    quietly "build/$preset/configure.log" cmake --preset "$preset"
    quietly "build/$preset/build.log" cmake --build --preset "$preset" --target "$@"
}
