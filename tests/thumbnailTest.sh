#!/bin/sh
# The thumbnail example: what it writes, and that a failure is told, ends with
# status 1 and leaves no file behind.
#
#     thumbnailTest.sh PROGRAM
set -u

thumbnail=$(realpath "$1")
. "$(dirname "$0")/support/scratch.sh"

# Pictures of 4 by 2 pixels.
base64 -d > rgba.png <<'END'
iVBORw0KGgoAAAANSUhEUgAAAAQAAAACCAYAAAB/qH1jAAAAEUlEQVR42mPgEpFrQMYM6AIAXlIF4Q7hxv8AAAAASUVORK5CYII=
END
base64 -d > rgb.png <<'END'
iVBORw0KGgoAAAANSUhEUgAAAAQAAAACCAIAAADwyuo0AAAAEElEQVR42mPgEpGDIwZkDgAX2gHhEd5X7QAAAABJRU5ErkJggg==
END
base64 -d > palette.png <<'END'
iVBORw0KGgoAAAANSUhEUgAAAAQAAAACAgMAAAACxpXwAAAADFBMVEUAAQIDBAUGBwgJCgvcTDicAAAADElEQVR42mOQZpAGAABwADe2Fq01AAAAAElFTkSuQmCC
END
head -c 70 rgb.png > truncated.png
mkdir directory.png

# bytes FILE OFFSET COUNT: some bytes of a file, in decimal.
bytes() {
    od -An -v -tu1 -j"$2" -N"$3" "$1" | tr -s ' \n' ' ' | sed 's/^ //; s/ $//'
}

# png WIDTH HEIGHT COLOUR-TYPE ARGUMENTS...
png() {
    want="0 0 0 $1 0 0 0 $2 8 $3"
    shift 3
    "$thumbnail" "$@" out.png || complain "$*: status $?"
    [ "$(bytes out.png 16 10)" = "$want" ] || complain "$*: $(bytes out.png 16 10)"
    rm -f out.png
}

# fails MESSAGE ARGUMENTS...: part of the message on standard error.
fails() {
    message=$1
    shift
    before=$(ls -l)
    errors=$("$thumbnail" "$@" 2>&1)
    status=$?
    [ $status -eq 1 ] || complain "$*: status $status"
    echo "$errors" | grep -q "^thumbnail: .*$message" || complain "$*: $errors"
    [ "$(ls -l)" = "$before" ] || complain "$*: left something behind"
}

png 4 2 6 rgba.png
png 4 2 2 rgb.png
png 2 1 6 rgba.png --width 2
png 8 4 2 --height=4 palette.png
png 2 4 2 rgb.png --crop 3,0,1x2 --width 2

"$thumbnail" palette.png out.BMP --crop 1,1,2x1 || complain "palette.png out.BMP: status $?"
# Palette entries 1 and 2 of that row, blue first.
[ "$(bytes out.BMP 54 8)" = "5 4 3 8 7 6 0 0" ] || complain "out.BMP: $(bytes out.BMP 54 8)"
[ "$("$thumbnail" --help | head -c 16)" = "usage: thumbnail" ] || complain "--help"

echo "an older picture" > target.png
fails 'No such file' missing.png target.png
fails 'not a whole PNG' truncated.png target.png
fails 'not a whole PNG' directory.png target.png
fails 'cannot be written' rgb.png nowhere/target.png
fails 'directory' rgb.png directory.png
fails 'must end in .png or .bmp' rgb.png .png
fails 'one input and one output' rgb.png target.png more.png
fails 'unknown option' rgb.png target.png --sharpen
for width in 0 12x '' ' 4' 32768; do
    fails 'takes a whole number' rgb.png target.png --width "$width"
done
for crop in 1,1,2 1,1,2x2x 0,0,0x1; do
    fails 'takes X,Y,WxH' rgb.png target.png --crop "$crop"
done
fails 'cannot be cut' rgb.png target.png --crop 3,0,2x2
fails 'cannot be cut' rgb.png target.png --crop 0,0,4x1 --height 32767
[ "$(cat target.png)" = "an older picture" ] || complain "the target was touched"

exit $((failures != 0))
