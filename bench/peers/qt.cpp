// Qt: regions.
#include "peers.h"

#include <QtGui/QRegion>

namespace quillon::bench {
namespace {

class QtRegion {
public:
    void add(const RegionStep &step) { region += rect(step); }
    void cut(const RegionStep &step) { region -= rect(step); }
    uint32_t area() const {
        uint32_t sum = 0;
        for (const QRect &rect : region)
            sum += uint32_t(rect.width()) * uint32_t(rect.height());
        return sum;
    }

private:
    static QRect rect(const RegionStep &step) { return {step.x, step.y, step.width, step.height}; }
    QRegion region;
};

} // namespace

std::string offerQt(const Peer &peer) {
    peer.offerRegions<QtRegion>();
    return qVersion();
}

} // namespace quillon::bench
