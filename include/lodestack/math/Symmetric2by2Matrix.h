// Symmetric2by2Matrix: a symmetric 2 x 2 matrix of doubles, stored as its
// three distinct elements in the order (0,0), (0,1), (1,1).
//
// A plain value type: copy it freely; any thread may use its own copies.
// operator[] takes an index 0 to 2 and does not check it.
#ifndef LODESTACK_MATH_SYMMETRIC2BY2MATRIX_H
#define LODESTACK_MATH_SYMMETRIC2BY2MATRIX_H

#include "lodestack/core/Export.h"

namespace lodestack {

class LODESTACK_EXPORT Symmetric2by2Matrix {
 public:
  // Below this magnitude of the determinant invmat() treats a matrix as
  // singular.
  static constexpr double kSingularDeterminant = 1e-19;

  Symmetric2by2Matrix() : m_{0.0, 0.0, 0.0} {}
  Symmetric2by2Matrix(double m00, double m01, double m11) : m_{m00, m01, m11} {}

  double& operator[](unsigned int index) { return m_[index]; }
  double operator[](unsigned int index) const { return m_[index]; }

  void clear() { m_[0] = m_[1] = m_[2] = 0.0; }
  // (0,0) x (1,1) - (0,1)^2.
  double det() const { return m_[0] * m_[2] - m_[1] * m_[1]; }

  // Makes this matrix the inverse of `source` (which may be this matrix).
  // False, with this matrix unchanged, when |det| of the source is below
  // kSingularDeterminant.
  bool invmat(const Symmetric2by2Matrix& source);

  // Makes this matrix the symmetric product a b a (a congruence of b by the
  // symmetric a, as in a covariance propagation F P F^T). Either argument may
  // be this matrix.
  void prodmat(const Symmetric2by2Matrix& a, const Symmetric2by2Matrix& b);

  Symmetric2by2Matrix operator+(const Symmetric2by2Matrix& other) const;
  Symmetric2by2Matrix& operator+=(const Symmetric2by2Matrix& other);
  Symmetric2by2Matrix operator-(const Symmetric2by2Matrix& other) const;
  Symmetric2by2Matrix& operator-=(const Symmetric2by2Matrix& other);
  Symmetric2by2Matrix& operator*=(double factor);
  Symmetric2by2Matrix operator/(double divisor) const;
  Symmetric2by2Matrix& operator/=(double divisor);

  bool operator==(const Symmetric2by2Matrix& other) const;
  bool operator!=(const Symmetric2by2Matrix& other) const { return !(*this == other); }

 protected:
  double m_[3];
};

}  // namespace lodestack

#endif  // LODESTACK_MATH_SYMMETRIC2BY2MATRIX_H
