"""The example for Python does what it says, and refuses what would leave an array."""
import pathlib
import sys

sys.path.insert(0, str(pathlib.Path(__file__).parent.parent / "examples"))
sys.dont_write_bytecode = True
import numpy
import numpyPixels

numpyPixels.main()
before, after = numpyPixels.read(sys.argv[1]), numpyPixels.read(sys.argv[2])
height, width, _ = before.shape
assert (after[:height // 8] == [0x90, 0x66, 0x2F, 0xFF]).all()
middle = numpy.s_[height // 4:height - height // 4, width // 4:width - width // 4]
assert (after[middle][..., :3] <= before[middle][..., :3] // 2 + 1).all()
after[:height // 8] = before[:height // 8]
after[middle] = before[middle]
assert (after == before)[..., :3].all()

for part in [(-1, 0, 1, 1), (width, 0, 1, 1), (0, height - 1, 1, 2)]:
    try:
        numpyPixels.fill(after, 0, *part)
    except ValueError:
        continue
    sys.exit("wrote outside")
