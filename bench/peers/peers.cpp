#include "peers.h"

namespace quillon::bench {
namespace {

constexpr struct {
    const char *name;
    Offer *offer;
} kPeers[] = {{"pixman", offerPixman},   {"libyuv", offerLibyuv}, {"OpenCV", offerOpenCv},
              {"swscale", offerSwscale}, {"SDL", offerSdl},       {"libspng", offerSpng},
              {"libpng", offerLibpng}};

} // namespace

std::string peerText() {
    std::string names;
    for (const auto &[name, offer] : kPeers)
        names += text(names.empty() ? "" : ", ", name,
                      offer == nullptr ? " (not installed, left out)" : "");
    return names;
}

void addPeers(std::vector<Operation> &operations) {
    for (const auto &[name, offer] : kPeers)
        if (offer != nullptr)
            offer({name, operations});
}

} // namespace quillon::bench
