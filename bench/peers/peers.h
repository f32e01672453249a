// Other libraries that do the same, as far as they were there when this was built.
#pragma once

#include "../comparison.h"

#include <map>

namespace quillon::bench {

// Who else does an operation, by its name.
using Offers = std::map<std::string, std::vector<Contender>>;

// Each in a file of its own, which is left out of the program where its library
// is not installed; the address is null then.
[[gnu::weak]] void offerPixman(Offers &offers);
[[gnu::weak]] void offerLibyuv(Offers &offers);
[[gnu::weak]] void offerOpenCv(Offers &offers);
[[gnu::weak]] void offerSwscale(Offers &offers);
[[gnu::weak]] void offerSdl(Offers &offers);
[[gnu::weak]] void offerSpng(Offers &offers);

// What the library has to be faster than at any shape.  No peer.
void offerPlainLoops(Offers &offers);

struct Peer {
    const char *name;
    void (*offer)(Offers &); // null: it was not there
};

// All that this program knows of.
const std::vector<Peer> &peers();

// Adds to every operation those who offer it.
void addPeers(Plan &plan);

} // namespace quillon::bench
