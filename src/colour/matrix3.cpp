#include "colour/matrix3.h"

#include <cmath>

namespace vantrel {
namespace {

double Determinant(const double (&m)[3][3]) {
    return m[0][0] * (m[1][1] * m[2][2] - m[1][2] * m[2][1]) - m[0][1] * (m[1][0] * m[2][2] - m[1][2] * m[2][0]) +
           m[0][2] * (m[1][0] * m[2][1] - m[1][1] * m[2][0]);
}

bool Usable(double det) { return std::isfinite(det) && std::fabs(det) >= 1e-300; }

}  // namespace

bool InvertMatrix3(const double (&m)[3][3], double (&inverse)[3][3]) {
    const double det = Determinant(m);
    if (!Usable(det)) return false;
    for (int r = 0; r < 3; ++r)
        for (int c = 0; c < 3; ++c) {
            // The cofactor of element (c, r), transposed into place.
            const int r1 = (c + 1) % 3, r2 = (c + 2) % 3, c1 = (r + 1) % 3, c2 = (r + 2) % 3;
            inverse[r][c] = (m[r1][c1] * m[r2][c2] - m[r1][c2] * m[r2][c1]) / det;
        }
    return true;
}

bool SolveMatrix3(const double (&m)[3][3], const double* y, double* x) {
    const double det = Determinant(m);
    if (!Usable(det)) {
        for (int k = 0; k < 3; ++k) x[k] = y[k];
        return false;
    }
    double solution[3];
    for (int column = 0; column < 3; ++column) {
        double replaced[3][3];
        for (int r = 0; r < 3; ++r)
            for (int c = 0; c < 3; ++c) replaced[r][c] = c == column ? y[r] : m[r][c];
        solution[column] = Determinant(replaced) / det;
    }
    for (int k = 0; k < 3; ++k) x[k] = solution[k];
    return true;
}

}  // namespace vantrel
