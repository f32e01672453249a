# What the scripts share that build for arm64 and run the emulator.
sysroot=build/arm64-sysroot

# apt-get for another architecture, with lists and packages in a folder of its
# own: what is installed on this machine stays as it is.
aptForArm64() {
    local folder=$PWD/build/arm64-apt
    mkdir -p "$folder"/{lists,archives}/partial
    : >"$folder/status"
    apt-get -q -y -o APT::Architecture=arm64 -o APT::Architectures=arm64 \
        -o APT::Sandbox::User=root -o Dir::State="$folder" \
        -o Dir::State::status="$folder/status" -o Dir::Cache="$folder" "$@"
}

# Adds the libraries to the sysroot.
unpackForArm64() { # PACKAGE...
    local mark=$sysroot/complete-$(printf '%s\n' "$@" | cksum | cut -d ' ' -f 1) package
    [ ! -e "$mark" ] || return 0
    command -v dpkg-deb >/dev/null || return 1
    say "Fetching packages for arm64"
    aptForArm64 update &&
        aptForArm64 install --download-only --no-install-recommends "$@" || return 1
    mkdir -p $sysroot
    for package in build/arm64-apt/archives/*.deb; do
        dpkg-deb -x "$package" $sysroot
    done
    # Links are meant for a root; a merged /usr is a matter of the system.
    find $sysroot -type l -lname '/*' -printf '%p %l\n' | while read -r link target; do
        ln -sfn "$PWD/$sysroot$target" "$link"
    done
    [ -e $sysroot/lib ] || ln -s usr/lib $sysroot/lib
    touch "$mark"
}
