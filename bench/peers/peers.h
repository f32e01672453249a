// Other libraries that do the same, as far as they were installed when this was
// built.
#pragma once

#include "../regions.h"

#include <fnmatch.h>

namespace quillon::bench {

// A library, which adds itself as a contender to the operations that it has.
struct Peer {
    const char *library;
    std::vector<Operation> &operations;

    // The names of the operations are a pattern of fnmatch.
    template <class Call>
    void offer(const std::string &names, const Call &call, Kind kind = Kind::Approximate,
               const Prepare &prepareCheck = {}) const {
        for (Operation &operation : operations)
            if (fnmatch(names.c_str(), operation.name.c_str(), 0) == 0)
                operation.contenders.push_back({library, prepare(call), kind, prepareCheck});
    }

    // A region of the library, as regions.h wants it.
    template <class Region>
    void offerRegions() const {
        for (const auto &[name, steps] : regionSequences())
            offer(text("rectangles ", name), regionWork<Region>(steps), Kind::Exact,
                  regionCheck<Region>(steps));
    }
};

// Each in a file of its own, which is left out of the program where its library
// is not installed; the address is null then.  Returns the version of the library.
using Offer = std::string(const Peer &peer);
[[gnu::weak]] Offer offerPixman, offerLibyuv, offerOpenCv, offerSwscale, offerSdl, offerSpng,
    offerLibpng, offerQt;

// Adds the libraries to the operations that they have.  Returns their names and
// versions, and which of them are missing.
std::string addPeers(std::vector<Operation> &operations);

} // namespace quillon::bench
