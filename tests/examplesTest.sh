#!/bin/sh
# Three of the examples: what they print, the pixels of the pictures they write, and
# that a failure is told and ends with status 1.
#
#     examplesTest.sh {cursorScreen|damage|yuvToPng} FOLDER-OF-THE-PROGRAMS
set -u

example=$1
programs=$(realpath "$2")
. "$(dirname "$0")/support/scratch.sh"

# same WHAT WANTED FOUND
same() {
    [ "$2" = "$3" ] || complain "$1: wanted '$2', found '$3'"
}

# fails MESSAGE ARGUMENTS...: part of the message on standard error.
fails() {
    message=$1
    shift
    errors=$("$programs/$example" "$@" 2>&1 >output)
    same "$*: status" 1 $?
    echo "$errors" | grep -q "^$example: .*$message" || complain "$*: $errors"
}

# decode FILE.png: its pixels, as the rows of a BMP.
decode() {
    "$programs/thumbnail" "$1" decoded.bmp || complain "$1 is not a picture"
}

# row Y WIDTH HEIGHT [X COUNT]: colours of the decoded picture, in hexadecimal,
# blue first.  A BMP begins with its bottom row.
row() {
    step=$((($2 * 3 + 3) / 4 * 4))
    od -An -v -tx1 -w3 -j$((54 + ($3 - 1 - $1) * step + ${4:-0} * 3)) -N$((${5:-$2} * 3)) \
        decoded.bmp | tr -d ' ' | tr '\n' ' ' | sed 's/ $//'
}

testCursorScreen() {
    "$programs/cursorScreen" sheet.png >output || complain "status $?"
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
    # On the second display: the middle of the disc, its rim and what lies behind.
    same "disc" "00e0ff" "$(row 51 688 216 204 1)"
    same "rim" "4b6787 506080" "$(row 51 688 216 219 2)"
    # On the one below: the left edge of the arrow, and the square that inverts.
    same "arrow" "606068 000000 ffffff ffffff" "$(row 160 688 216 203 4)"
    same "square" "af9f7f" "$(row 167 688 216 214 1)"

    fails 'give the name'
    fails 'give the name' nowhere/sheet.png
}

testDamage() {
    "$programs/damage" >output || complain "status $?"
    # Every branch is taken: numbers of 0 would say that one is not.
    same "output" "\
500 refreshes converted 0.81% of the pixels and saved 126962926.
232 updates were outside, 51 lists became boxes, 10 parts could not be cut." "$(cat output)"
}

# frame FORMAT WIDTH HEIGHT ROW...: converts frame.yuv, and compares its rows.
frame() {
    arguments="$1 $2 $3"
    width=$2
    height=$3
    "$programs/yuvToPng" frame.yuv "$2" "$3" "$1" frame.png || complain "$arguments: status $?"
    decode frame.png
    shift 3
    y=0
    for want; do
        same "$arguments, row $y" "$want" "$(row $y "$width" "$height")"
        y=$((y + 1))
    done
}

testYuvToPng() {
    # Luma and chroma, in octal: black and white have chroma 200 200.
    #   red Y 121 U 132 V 360   blue Y 51 U 360 V 156   green Y 221 U 66 V 42
    red=0000ff
    blue=ff0000
    green=01ff00
    black=000000
    white=ffffff
    # Two rows of an odd width: the fourth pixel of each is padding.
    printf '\121\132\121\360\051\360\051\156\020\200\353\200\221\066\020\042' >frame.yuv
    frame YUY2 3 2 "$red $red $blue" "$black $white $green"
    frame YUY2 4 2 "$red $red $blue $blue" "$black $white $green 006900"
    printf '\132\121\360\121\360\051\156\051\200\020\200\353\066\221\042\020' >frame.yuv
    frame UYVY 3 2 "$red $red $blue" "$black $white $green"
    printf '\132\121\360\051\360\051\156\121' >frame.yuv
    frame UYVY 1 2 "$red" "$blue"
    # Luma, V, U of four squares; of those on the right and below one column or row.
    printf '\121\121\051\051\121\121\051\051\221\221\353\020\221\221\353\020' >frame.yuv
    printf '\360\156\042\200\132\360\066\200' >>frame.yuv
    frame YV12 3 3 "$red $red $blue" "$red $red $blue" "$green $green $white"
    frame YV12 4 4 "$red $red $blue $blue" "$red $red $blue $blue" \
        "$green $green $white $black" "$green $green $white $black"

    fails 'usage: ' frame.yuv 4 4 YV12
    fails 'has 24 bytes, but such a frame has 32' frame.yuv 4 4 YUY2 out.png
    fails 'has 24 bytes, but such a frame has 12' frame.yuv 3 2 YV12 out.png
    fails 'the format must be' frame.yuv 4 4 yv12 out.png
    for side in 0 -4 4x '' ' 4' 16385 4294967300; do
        fails 'the width must be' frame.yuv "$side" 4 YV12 out.png
        fails 'the height must be' frame.yuv 4 "$side" YV12 out.png
    done
    fails 'No such file' missing.yuv 4 4 YV12 out.png
    mkdir folder
    fails 'folder: ' folder 4 4 YV12 out.png
    [ ! -e out.png ] || complain "out.png was written"
}

case $example in
cursorScreen) testCursorScreen ;;
damage) testDamage ;;
yuvToPng) testYuvToPng ;;
*) complain "no example of the name $example" ;;
esac
exit $((failures != 0))
