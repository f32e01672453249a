// The picture that the image operations work on, 32 bits a pixel.
#pragma once

#include <quillon/imageUtil.h>

#include <vector>

namespace quillon::bench {

const ImageInfo &picture();

constexpr int32_t kPngLevel = 6;

// The same as a PNG, compressed at that level.
const std::vector<uint8_t> &pngFile();

} // namespace quillon::bench
