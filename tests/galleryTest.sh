#!/bin/sh
# The gallery: that its page shows every picture made and no other, whatever the
# size of the picture it is made of, and that a failure is told and ends with
# status 1.
#
#     galleryTest.sh PROGRAM PICTURES
set -u

gallery=$(realpath "$1")
pictures=$(realpath "$2")
. "$(dirname "$0")/support/scratch.sh"

# 4 by 2 pixels of a palette, one pixel of RGB, and 4 by 2 pixels of grey.
base64 -d > palette.png <<'END'
iVBORw0KGgoAAAANSUhEUgAAAAQAAAACAgMAAAACxpXwAAAADFBMVEUAAQIDBAUGBwgJCgvc
TDicAAAADElEQVR42mOQZpAGAABwADe2Fq01AAAAAElFTkSuQmCC
END
base64 -d > pixel.png <<'END'
iVBORw0KGgoAAAANSUhEUgAAAAEAAAABCAIAAACQd1PeAAAADElEQVR42mM44KAAAALkASG/
2BtkAAAAAElFTkSuQmCC
END
base64 -d > grey.png <<'END'
iVBORw0KGgoAAAANSUhEUgAAAAQAAAACCAAAAABawyK/AAAAC0lEQVR42mNggAEAAAoAAewk
A7kAAAAASUVORK5CYII=
END

# succeeds PICTURE: the files named on the page are the files there are.
succeeds() {
    rm -rf page
    mkdir page
    "$gallery" "$1" "$pictures/marble.png" page || complain "$1: status $?"
    grep -o '\(src\|href\)="[^"#]*"' page/index.html | cut -d'"' -f2 | sort -u > named
    ls page | grep -v '^index.html$' | sort > made
    [ -s made ] && diff named made || complain "$1: what the page names, and what was made"
}

# fails MESSAGE PICTURE: part of the message on standard error.
fails() {
    rm -rf page
    mkdir page
    errors=$("$gallery" "$2" "$pictures/marble.png" page 2>&1)
    status=$?
    [ $status -eq 1 ] || complain "$2: status $status"
    case $errors in
    *"$1"*) ;;
    *) complain "$2: said '$errors'" ;;
    esac
    [ -z "$(ls page)" ] || complain "$2: files were made"
}

succeeds "$pictures/lake.png"
succeeds palette.png
succeeds pixel.png
fails "grey.png cannot be read as a PNG" grey.png
fails "missing.png cannot be read as a PNG" missing.png

[ $failures -eq 0 ]
