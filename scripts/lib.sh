# What the scripts share; each one sources it first.  It goes to the root of the
# repository, and answers --help with the comment at the top of the script.
set -eu
case "${1:-}" in
-h | --help)
    sed -n '2,/^[^#]/s/^# \{0,1\}//p' "$0"
    exit 0
    ;;
esac
callerFolder=$PWD
cd "$(dirname "${BASH_SOURCE[0]}")/.."

# Debian packages, by what they are needed for.
buildPackages=(cmake g++ ninja-build pkg-config libpng-dev libhwy-dev libgtest-dev)
benchPackages=(libbenchmark-dev)
peerPackages=(libpixman-1-dev libyuv-dev libopencv-imgproc-dev libswscale-dev libsdl2-dev libspng-dev qtbase5-dev)
desktopPackages=(libsdl2-dev libvncserver-dev)
formatPackages=(clang-format)
clangPackages=(clang libclang-rt-dev)
lintPackages=(clang clang-tidy)
interfacePackages=(abigail-tools)
arm64Packages=(g++-aarch64-linux-gnu qemu-user)
docsPackages=(doxygen python3 python3-numpy)
packagePackages=(build-essential debhelper fakeroot lintian)
arm64Libraries=(libpng-dev libhwy-dev libgtest-dev) # for that processor
arm64BenchLibraries=(libpng-dev libhwy-dev libbenchmark-dev libpixman-1-dev libyuv-dev)

say() { printf '\n== %s\n' "$*"; }
fail() {
    printf '%s\n' "$*" >&2
    exit 1
}

asRoot() { # COMMAND...
    if [ "$(id -u)" -eq 0 ]; then "$@"; else sudo "$@"; fi
}

# Installs those of the given packages that are missing.
need() {
    if ! command -v dpkg-query >/dev/null; then
        echo "This is no Debian; taking these for granted, under whatever name: $*"
        return
    fi
    local missing=() package
    for package; do
        dpkg-query -W -f='${Status}' "$package" 2>/dev/null | grep -q '^install ok installed' ||
            missing+=("$package")
    done
    [ ${#missing[@]} -gt 0 ] || return 0

    [ "$(id -u)" -eq 0 ] || command -v sudo >/dev/null ||
        fail "Missing, and only root can install them: apt-get install ${missing[*]}"
    say "Installing ${missing[*]}"
    # An installation that was interrupted is finished first.
    { asRoot env DEBIAN_FRONTEND=noninteractive dpkg --configure -a && asRoot apt-get update -q &&
        asRoot env DEBIAN_FRONTEND=noninteractive apt-get install -y -q --fix-broken \
            --no-install-recommends -o DPkg::Lock::Timeout=300 "${missing[@]}"; } ||
        fail "Missing, and could not be installed: ${missing[*]}"
}

# Configures build/PRESET and builds it, or only the given targets.
build() { # PRESET [TARGET...]
    local preset=$1 target targets=()
    shift
    for target; do targets+=(--target "$target"); done
    say "Configuring build/$preset"
    cmake --preset "$preset" --log-level=WARNING
    say "Building ${*:-everything} in build/$preset"
    cmake --build --preset "$preset" "${targets[@]}"
}

# C and C++ files of this repository, below the given folders or everywhere.
sources() { # [FOLDER...]
    find "${@:-.}" -name build\* -prune -o -name .git -prune -o \
        \( -name '*.h' -o -name '*.hpp' -o -name '*.c' -o -name '*.cpp' \) -print | sort
}
