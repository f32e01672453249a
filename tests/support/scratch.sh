# Sourced by the tests of programs: a folder of their own to work in, which goes
# with them, and a count of what has failed.
directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT
cd "$directory" || exit 1
failures=0

complain() {
    echo "FAILED: $*" >&2
    failures=$((failures + 1))
}
