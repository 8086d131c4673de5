#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace vantrel {

// What the sample-driven corrections gather at one table node: the total weight of the samples
// that reached it and their weighted correction sums, per output channel (four device channels,
// or L* x 2.55, a*, b*).
struct NodeAccumulator {
    double weight = 0.0;
    double sum[4] = {0.0, 0.0, 0.0, 0.0};
};

// One accumulator per node of a grid of `grid` points on each of `axes` axes, first axis
// slowest. Sized by the table being corrected, allocated for one run.
class NodeAccumulators {
public:
    // Most records a run may ask for: a 100-point three-input grid, or a 5-point grid on
    // seven axes, fit easily; more would not fit a 32-bit host.
    static constexpr uint64_t kMaxRecords = uint64_t{1} << 22;

    // Allocates grid^axes cleared records. False, and nothing held, when the grid is outside
    // 1..100, the count is too large or the memory cannot be had.
    bool Allocate(int grid, int axes);
    void Free();

    int Grid() const { return grid_; }
    std::size_t Size() const { return nodes_.size(); }
    NodeAccumulator& operator[](std::size_t index) { return nodes_[index]; }
    const NodeAccumulator& operator[](std::size_t index) const { return nodes_[index]; }
    // The record of node (i, j, k) of a three-axis grid.
    NodeAccumulator& At(int i, int j, int k) { return nodes_[Index(i, j, k)]; }
    const NodeAccumulator& At(int i, int j, int k) const { return nodes_[Index(i, j, k)]; }

private:
    std::size_t Index(int i, int j, int k) const {
        const std::size_t g = static_cast<std::size_t>(grid_);
        return (static_cast<std::size_t>(i) * g + static_cast<std::size_t>(j)) * g + static_cast<std::size_t>(k);
    }

    std::vector<NodeAccumulator> nodes_;
    int grid_ = 0;
};

// Calls visit(i, j, k, weight) for each corner of the cell whose lower corner is (i0, j0, k0),
// first index slowest, with that corner's own weight from the eight LocateCell gives; corners
// past the grid's last node are left out.
template <typename Visit>
void ForEachCellCorner(int grid, int i0, int j0, int k0, const double* weights, Visit visit) {
    for (int corner = 0; corner < 8; ++corner) {
        const int i = i0 + (corner >> 2 & 1);
        const int j = j0 + (corner >> 1 & 1);
        const int k = k0 + (corner & 1);
        if (i < grid && j < grid && k < grid) visit(i, j, k, weights[corner]);
    }
}

}  // namespace vantrel
