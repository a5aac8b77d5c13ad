// Symmetric4by4Matrix: a symmetric 4 x 4 matrix of doubles, the covariance
// of a four-element state. Its ten distinct elements are stored in the order
// (0,0), (0,1), (1,1), (0,2), (1,2), (0,3), (1,3), (2,2), (2,3), (3,3): the
// upper 2 x 2 block, the four cross terms, the lower 2 x 2 block. The
// diagonal is therefore elements 0, 2, 7 and 9.
//
// A plain value type; operator[] takes 0 to 9 and does not check it. Any
// thread may use its own copies.
#ifndef LODESTACK_MATH_SYMMETRIC4BY4MATRIX_H
#define LODESTACK_MATH_SYMMETRIC4BY4MATRIX_H

#include "lodestack/core/Export.h"

namespace lodestack {

class LODESTACK_EXPORT Symmetric4by4Matrix {
 public:
  static constexpr unsigned int kElements = 10;

  Symmetric4by4Matrix() { clear(); }
  Symmetric4by4Matrix(double e0, double e1, double e2, double e3, double e4, double e5,
                      double e6, double e7, double e8, double e9)
      : m_{e0, e1, e2, e3, e4, e5, e6, e7, e8, e9} {}

  // The storage index of element (row, column), both 0 to 3, either order.
  static unsigned int index(unsigned int row, unsigned int column);

  void clear();
  double& operator[](unsigned int i) { return m_[i]; }
  double operator[](unsigned int i) const { return m_[i]; }
  double at(unsigned int row, unsigned int column) const { return m_[index(row, column)]; }

  Symmetric4by4Matrix& operator+=(const Symmetric4by4Matrix& other);
  bool operator==(const Symmetric4by4Matrix& other) const;
  bool operator!=(const Symmetric4by4Matrix& other) const { return !(*this == other); }

  // Makes this matrix the inverse of `source` (which may be this matrix).
  // False, with this matrix unchanged, when the source is singular to
  // working precision (a zero matrix included).
  bool invmat(const Symmetric4by4Matrix& source);

  // True when none of the diagonal elements 0, 2, 7, 9 is 0.0.
  bool diagonalNonZero() const;

 protected:
  double m_[kElements];
};

}  // namespace lodestack

#endif  // LODESTACK_MATH_SYMMETRIC4BY4MATRIX_H
