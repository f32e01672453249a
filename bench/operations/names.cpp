#include "names.h"

#include <quillon/raster.h>

#include <cstdio>

namespace quillon::bench {

std::string ropName(uint32_t rop) {
    constexpr const char *kNames[] = {"clear",         "and",         "and reverse", "copy",
                                      "and inverted",  "noop",        "xor",         "or",
                                      "nor",           "equiv",       "invert",      "or reverse",
                                      "copy inverted", "or inverted", "nand",        "set"};
    return kNames[rop];
}

std::string ropFamily(const std::string &operation, uint32_t rop) {
    switch (rop) {
    case RASTER_ROP_AND:
    case RASTER_ROP_OR:
    case RASTER_ROP_XOR:
    case RASTER_ROP_COPY:
    case RASTER_ROP_INVERT:
    case RASTER_ROP_COPY_INVERTED:
        return operation;
    default:
        return operation + ", rarer codes";
    }
}

bool ropReadsDestination(uint32_t rop) {
    switch (rop) {
    case RASTER_ROP_CLEAR:
    case RASTER_ROP_COPY:
    case RASTER_ROP_COPY_INVERTED:
    case RASTER_ROP_SET:
        return false;
    default:
        return true;
    }
}

std::string conversionName(int32_t srcDepth, int32_t dstDepth) {
    const std::string from = srcDepth == kIndex ? "index" : "convert " + std::to_string(srcDepth);
    return from + " to " + std::to_string(dstDepth);
}

std::string scaleName(const std::string &filter, double factor) {
    char digits[16];
    std::snprintf(digits, sizeof(digits), "%g", factor);
    return filter + " by " + digits;
}

} // namespace quillon::bench
