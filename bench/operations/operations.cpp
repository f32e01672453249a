#include "operations.h"

namespace quillon::bench {

void addPixelOperations(Plan &plan, const Area &area) {
    for (const auto add :
         {addFills, addCopies, addBlends, addBits, addConversions, addScaling, addVideo})
        add(plan, area);
}

} // namespace quillon::bench
