#include "operations.h"

namespace quillon::bench {
namespace {

constexpr const char *kNames[] = {
    "clear", "and",   "and reverse", "copy",       "and inverted",  "noop",        "xor",  "or",
    "nor",   "equiv", "invert",      "or reverse", "copy inverted", "or inverted", "nand", "set"};

// A bit of the code is the result for one pair of source and destination bits.
bool readsSrc(uint32_t rop) {
    return (rop >> 2 & 3) != (rop & 3);
}
bool readsDst(uint32_t rop) {
    return (rop >> 1 & 5) != (rop & 5);
}

void addRop(Plan &plan, uint32_t rop, uint32_t bits) {
    const std::string name = text(kNames[rop], " ", bits);
    const auto bytes = static_cast<int32_t>(bits / 8);
    const Traffic traffic = readsDst(rop) ? Traffic::Change : Traffic::Write;
    const std::vector<Plane> planes(readsSrc(rop) ? 2 : 1, {bits, noise});
    plan.add("raster fill " + name, "raster fill", traffic, {planes[0]}, [=](const Buffer &dst) {
        Raster_RectROPfill(dst.data, dst.stride, bytes, kPixel, rop, 0, 0, dst.width, dst.height);
    });
    plan.add("raster copy " + name, "raster copy", traffic, planes, [=](const Job &job) {
        const Buffer &dst = job.dst(), &src = job.planes[job.count - 1];
        Raster_RectROPcopy(dst.data, dst.stride, src.data, src.stride, bytes, 0, 0, rop, 0, 0,
                           dst.width, dst.height);
    });
}

} // namespace

void addRops(Plan &plan) {
    for (uint32_t rop = 0; rop < 16; ++rop)
        if (rop != RASTER_ROP_NOOP)
            addRop(plan, rop, 32);
    for (const uint32_t bits : {8U, 16U, 24U})
        addRop(plan, RASTER_ROP_XOR, bits);
}

} // namespace quillon::bench
