#include "peers.h"

namespace quillon::bench {

const std::vector<Peer> &peers() {
    static const std::vector<Peer> all = {
        {"pixman", offerPixman},   {"libyuv", offerLibyuv}, {"OpenCV", offerOpenCv},
        {"swscale", offerSwscale}, {"SDL", offerSdl},       {"libspng", offerSpng},
    };
    return all;
}

void addPeers(Plan &plan) {
    Offers offers;
    for (const Peer &peer : peers()) {
        if (peer.offer != nullptr)
            peer.offer(offers);
    }
    for (Operation &operation : plan) {
        const auto found = offers.find(operation.name);
        if (found != offers.end())
            operation.contenders.insert(operation.contenders.end(), found->second.begin(),
                                        found->second.end());
    }
}

} // namespace quillon::bench
