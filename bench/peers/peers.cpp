#include "peers.h"

namespace quillon::bench {
namespace {

constexpr struct {
    const char *name;
    Offer *offer;
} kPeers[] = {{"pixman", offerPixman},   {"libyuv", offerLibyuv}, {"OpenCV", offerOpenCv},
              {"swscale", offerSwscale}, {"SDL", offerSdl},       {"libspng", offerSpng},
              {"libpng", offerLibpng},   {"Qt", offerQt}};

} // namespace

std::string addPeers(std::vector<Operation> &operations) {
    std::string names;
    for (const auto &[name, offer] : kPeers)
        names += text(names.empty() ? "" : ", ", name, " ",
                      offer == nullptr ? "(not installed, left out)" : offer({name, operations}));
    return names;
}

} // namespace quillon::bench
