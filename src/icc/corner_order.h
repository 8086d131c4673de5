#pragma once

#include <array>
#include <cstdint>

namespace vantrel {

// The corners of a cell of n inputs as sets of raised channels (bit i = channel i), in the
// order the corner-offset table of a slot lists them: by the number of raised channels,
// then by channel index ({0}, {1}, {2}, {0,1}, {0,2}, {1,2}, {0,1,2} after the first corner).
class CornerOrder {
public:
    static constexpr int kMaxInputs = 7;

    // The raised-channel set of corner k of an n-input cell.
    static uint8_t Mask(int inputs, int k) { return Table().masks[inputs][k]; }

private:
    struct Masks {
        std::array<std::array<uint8_t, 128>, kMaxInputs + 1> masks{};
    };

    static constexpr int Count(unsigned v) {
        int c = 0;
        for (; v; v &= v - 1) ++c;
        return c;
    }
    // True when set a comes before set b of the same size.
    static constexpr bool Before(unsigned a, unsigned b) {
        if (Count(a) != Count(b)) return Count(a) < Count(b);
        for (int i = 0; i < kMaxInputs; ++i) {
            const bool ia = (a >> i) & 1u, ib = (b >> i) & 1u;
            if (ia != ib) return ia;
        }
        return false;
    }
    static constexpr Masks Build() {
        Masks m{};
        for (int n = 0; n <= kMaxInputs; ++n) {
            const int corners = 1 << n;
            for (int k = 0; k < corners; ++k) m.masks[n][k] = static_cast<uint8_t>(k);
            for (int k = 1; k < corners; ++k) {  // insertion sort: 128 entries at most
                for (int p = k; p > 0 && Before(m.masks[n][p], m.masks[n][p - 1]); --p) {
                    const uint8_t keep = m.masks[n][p];
                    m.masks[n][p] = m.masks[n][p - 1];
                    m.masks[n][p - 1] = keep;
                }
            }
        }
        return m;
    }
    static const Masks& Table() {
        static constexpr Masks kTable = Build();
        return kTable;
    }
};

}  // namespace vantrel
