#include "lodestack/math/Symmetric4by4Matrix.h"

#include <cfloat>
#include <cmath>
#include <utility>

namespace lodestack {

namespace {
const unsigned char kIndex[4][4] = {{0, 1, 3, 5}, {1, 2, 4, 6}, {3, 4, 7, 8}, {5, 6, 8, 9}};
}  // namespace

unsigned int Symmetric4by4Matrix::index(unsigned int row, unsigned int column) {
  return kIndex[row][column];
}

void Symmetric4by4Matrix::clear() {
  for (double& e : m_) e = 0.0;
}

Symmetric4by4Matrix& Symmetric4by4Matrix::operator+=(const Symmetric4by4Matrix& other) {
  for (unsigned int i = 0; i < kElements; ++i) m_[i] += other.m_[i];
  return *this;
}

bool Symmetric4by4Matrix::operator==(const Symmetric4by4Matrix& other) const {
  for (unsigned int i = 0; i < kElements; ++i)
    if (m_[i] != other.m_[i]) return false;
  return true;
}

bool Symmetric4by4Matrix::invmat(const Symmetric4by4Matrix& source) {
  // Gauss-Jordan elimination with partial pivoting on [D A D | I], where D
  // scales every variable to a unit diagonal so that a state mixing tiny
  // position variances with large velocity variances is not mistaken for
  // singular; then A^-1 = D (D A D)^-1 D. A pivot that is zero to working
  // precision means A is singular. The inverse of a symmetric matrix is
  // symmetric; the mean of two mirrored elements absorbs rounding.
  double scale[4];
  for (int i = 0; i < 4; ++i) {
    const double d = std::fabs(source.m_[kIndex[i][i]]);
    scale[i] = d > 0.0 ? 1.0 / std::sqrt(d) : 1.0;
  }
  double a[4][4], inv[4][4];
  double largest = 0.0;
  for (int r = 0; r < 4; ++r) {
    for (int c = 0; c < 4; ++c) {
      a[r][c] = scale[r] * source.m_[kIndex[r][c]] * scale[c];
      inv[r][c] = r == c ? 1.0 : 0.0;
      largest = std::fmax(largest, std::fabs(a[r][c]));
    }
  }
  if (!(largest > 0.0) || !std::isfinite(largest)) return false;
  const double tiny = 16.0 * DBL_EPSILON * largest;

  for (int col = 0; col < 4; ++col) {
    int pivot = col;
    for (int r = col + 1; r < 4; ++r)
      if (std::fabs(a[r][col]) > std::fabs(a[pivot][col])) pivot = r;
    if (!(std::fabs(a[pivot][col]) > tiny)) return false;
    if (pivot != col) {
      std::swap(a[pivot], a[col]);
      std::swap(inv[pivot], inv[col]);
    }
    const double p = a[col][col];
    for (int c = 0; c < 4; ++c) {
      a[col][c] /= p;
      inv[col][c] /= p;
    }
    for (int r = 0; r < 4; ++r) {
      if (r == col) continue;
      const double f = a[r][col];
      if (f == 0.0) continue;
      for (int c = 0; c < 4; ++c) {
        a[r][c] -= f * a[col][c];
        inv[r][c] -= f * inv[col][c];
      }
    }
  }
  for (int r = 0; r < 4; ++r)
    for (int c = r; c < 4; ++c)
      m_[kIndex[r][c]] = scale[r] * 0.5 * (inv[r][c] + inv[c][r]) * scale[c];
  return true;
}

bool Symmetric4by4Matrix::diagonalNonZero() const {
  return m_[0] != 0.0 && m_[2] != 0.0 && m_[7] != 0.0 && m_[9] != 0.0;
}

}  // namespace lodestack
