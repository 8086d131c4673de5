#include "optimise/node_accumulator.h"

#include <new>

namespace vantrel {

bool NodeAccumulators::Allocate(int grid, int axes) {
    Free();
    if (grid < 1 || grid > 100 || axes < 1) return false;
    uint64_t count = 1;
    for (int a = 0; a < axes; ++a) {
        count *= static_cast<uint64_t>(grid);
        if (count > kMaxRecords) return false;
    }
    try {
        nodes_.assign(static_cast<std::size_t>(count), NodeAccumulator{});
    } catch (const std::bad_alloc&) {
        Free();
        return false;
    }
    grid_ = grid;
    return true;
}

void NodeAccumulators::Free() {
    std::vector<NodeAccumulator>().swap(nodes_);
    grid_ = 0;
}

}  // namespace vantrel
