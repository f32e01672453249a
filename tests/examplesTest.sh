#!/bin/sh
# The examples: what they print, the pixels of the pictures they write, and that
# a failure is told, ends with status 1 and leaves no file behind.
#
#     examplesTest.sh EXAMPLE FOLDER-OF-THE-PROGRAMS FOLDER-OF-THE-PICTURES
set -u

example=$1
programs=$(realpath "$2")
pictures=$(realpath "$3")
directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT
cd "$directory" || exit 1
failures=0

complain() {
    echo "FAILED: $*" >&2
    failures=$((failures + 1))
}

# same WHAT WANTED FOUND
same() {
    [ "$2" = "$3" ] || complain "$1: wanted '$2', found '$3'"
}

# runs ARGUMENTS...
runs() {
    "$programs/$example" "$@" >output || complain "$*: status $?"
}

# fails MESSAGE ARGUMENTS...: part of the message on standard error.
fails() {
    message=$1
    shift
    before=$(ls -lR)
    errors=$("$programs/$example" "$@" 2>&1)
    same "$*: status" 1 $?
    echo "$errors" | grep -q "^$example: .*$message" || complain "$*: $errors"
    same "$*: files" "$before" "$(ls -lR)"
}

# bytes FILE OFFSET COUNT: in hexadecimal.
bytes() {
    od -An -v -tx1 -j"$2" -N"$3" "$1" | tr -d ' \n'
}

# row Y WIDTH HEIGHT X COUNT: colours of decoded.bmp, blue first.  A BMP begins
# with its bottom row.
row() {
    bytes decoded.bmp $((54 + ($3 - 1 - $1) * (($2 * 3 + 3) / 4 * 4) + $4 * 3)) $(($5 * 3))
}

# decode FILE.png: its pixels, into decoded.bmp.
decode() {
    "$programs/thumbnail" "$1" decoded.bmp || complain "$1 is not a picture"
}

# Pictures of 4 by 2 pixels.
echo iVBORw0KGgoAAAANSUhEUgAAAAQAAAACCAYAAAB/qH1jAAAAEUlEQVR42mPgEpFrQMYM6AIAXlIF4Q7hxv8AAAAASUVORK5CYII= |
    base64 -d >rgba.png
echo iVBORw0KGgoAAAANSUhEUgAAAAQAAAACAgMAAAACxpXwAAAADFBMVEUAAQIDBAUGBwgJCgvcTDicAAAADElEQVR42mOQZpAGAABwADe2Fq01AAAAAElFTkSuQmCC |
    base64 -d >palette.png
echo iVBORw0KGgoAAAANSUhEUgAAAAQAAAACCAAAAABawyK/AAAAC0lEQVR42mNggAEAAAoAAewkA7kAAAAASUVORK5CYII= |
    base64 -d >grey.png

testThumbnail() {
    # thumb WIDTH HEIGHT COLOUR-TYPE ARGUMENTS...
    thumb() {
        want=$(printf '%08x%08x08%02x' "$1" "$2" "$3")
        shift 3
        runs "$@" out.png
        same "$*" "$want" "$(bytes out.png 16 10)"
    }
    thumb 4 2 6 rgba.png
    thumb 8 4 2 --height=4 palette.png
    thumb 2 4 2 palette.png --crop 3,0,1x2 --width 2
    runs palette.png out.BMP --crop 1,1,2x1
    # Palette entries 1 and 2 of that row, blue first.
    same "out.BMP" 0504030807060000 "$(bytes out.BMP 54 8)"

    head -c 70 rgba.png >truncated.png
    fails 'No such file' missing.png out.png
    fails 'not a whole PNG' truncated.png out.png
    fails 'cannot be written' rgba.png nowhere/out.png
    fails 'takes a whole number' rgba.png out.png --width 32768
    fails 'cannot be cut' rgba.png out.png --crop 3,0,2x2
}

testGallery() {
    mkdir page
    runs palette.png "$pictures/marble.png" page
    # The files named on the page are the files there are.
    grep -o '\(src\|href\)="[^"#]*"' page/index.html | cut -d'"' -f2 | sort -u >named
    same "page" "$(cat named)" "$(ls page | grep -v '^index.html$' | sort)"
    [ -s named ] || complain "nothing on the page"
    rm -r page
    mkdir page
    fails 'cannot be read as a PNG' grey.png "$pictures/marble.png" page
}

testCursorScreen() {
    runs sheet.png
    same "boxes" "\
(2, 3): 18 by 19 pixels at (0, 0)
(60, 43): 32 by 32 pixels at (44, 27)
(122, 30): 22 by 32 pixels at (106, 14)
(50, 90): 32 by 22 pixels at (34, 74)
(200, -40): 0 by 0 pixels at (0, 0)
(2, 3): 16 by 17 pixels at (2, 3)
(60, 43): 16 by 17 pixels at (60, 43)
(122, 30): 6 by 17 pixels at (122, 30)
(50, 90): 16 by 6 pixels at (50, 90)
(200, -40): 0 by 0 pixels at (0, 0)" "$(cat output)"
    decode sheet.png
    # On the second display the rim of a disc, on the one below that of the arrow.
    same "rim" 4b6787506080 "$(row 51 688 216 219 2)"
    same "arrow" 606068000000ffffff "$(row 160 688 216 203 3)"
}

testDamage() {
    runs
    # Every branch is taken: numbers of 0 would say that one is not.
    same "output" "\
500 refreshes converted 0.81% of the pixels and saved 126962926.
232 updates were outside, 51 lists became boxes, 10 parts could not be cut." "$(cat output)"
}

testYuvToPng() {
    # frame FORMAT WIDTH HEIGHT ROWS: converts frame.yuv, and compares two rows.
    frame() {
        runs frame.yuv "$2" "$3" "$1" frame.png
        decode frame.png
        same "$1 $2 $3" "$4" "$(row 0 "$2" "$3" 0 "$2") $(row $(($3 - 1)) "$2" "$3" 0 "$2")"
    }
    # Luma and chroma, in octal: black and white have chroma 200 200.
    #   red Y 121 U 132 V 360   blue Y 51 U 360 V 156   green Y 221 U 66 V 42
    red=0000ff blue=ff0000 green=01ff00 black=000000 white=ffffff
    # Two rows of an odd width: the fourth pixel of each is padding.
    printf '\121\132\121\360\051\360\051\156\020\200\353\200\221\066\020\042' >frame.yuv
    frame YUY2 3 2 "$red$red$blue $black$white$green"
    printf '\132\121\360\051\360\051\156\121' >frame.yuv
    frame UYVY 1 2 "$red $blue"
    # Luma, V, U of four squares; of those on the right and below one column or row.
    printf '\121\121\051\051\121\121\051\051\221\221\353\020\221\221\353\020' >frame.yuv
    printf '\360\156\042\200\132\360\066\200' >>frame.yuv
    frame YV12 3 3 "$red$red$blue $green$green$white"
    frame YV12 4 4 "$red$red$blue$blue $green$green$white$black"

    fails 'has 24 bytes, but such a frame has 32' frame.yuv 4 4 YUY2 out.png
    fails 'the height must be' frame.yuv 4 4294967300 YV12 out.png
}

case $example in
cursorScreen) testCursorScreen ;;
damage) testDamage ;;
gallery) testGallery ;;
thumbnail) testThumbnail ;;
yuvToPng) testYuvToPng ;;
*) complain "no example of the name $example" ;;
esac
exit $((failures != 0))
