#include "lodestack/math/Symmetric2by2Matrix.h"

#include <cmath>

namespace lodestack {

bool Symmetric2by2Matrix::invmat(const Symmetric2by2Matrix& source) {
  const double a = source.m_[0], b = source.m_[1], c = source.m_[2];
  const double det = a * c - b * b;
  if (std::fabs(det) < kSingularDeterminant) return false;
  m_[0] = c / det;
  m_[1] = -b / det;
  m_[2] = a / det;
  return true;
}

void Symmetric2by2Matrix::prodmat(const Symmetric2by2Matrix& a, const Symmetric2by2Matrix& b) {
  // (a b) first as a full matrix, then (a b) a; the product is symmetric,
  // so only its upper triangle is kept.
  const double ab00 = a.m_[0] * b.m_[0] + a.m_[1] * b.m_[1];
  const double ab01 = a.m_[0] * b.m_[1] + a.m_[1] * b.m_[2];
  const double ab10 = a.m_[1] * b.m_[0] + a.m_[2] * b.m_[1];
  const double ab11 = a.m_[1] * b.m_[1] + a.m_[2] * b.m_[2];
  const double r00 = ab00 * a.m_[0] + ab01 * a.m_[1];
  const double r01 = ab00 * a.m_[1] + ab01 * a.m_[2];
  const double r11 = ab10 * a.m_[1] + ab11 * a.m_[2];
  m_[0] = r00;
  m_[1] = r01;
  m_[2] = r11;
}

Symmetric2by2Matrix Symmetric2by2Matrix::operator+(const Symmetric2by2Matrix& other) const {
  Symmetric2by2Matrix result(*this);
  return result += other;
}

Symmetric2by2Matrix& Symmetric2by2Matrix::operator+=(const Symmetric2by2Matrix& other) {
  for (int i = 0; i < 3; ++i) m_[i] += other.m_[i];
  return *this;
}

Symmetric2by2Matrix Symmetric2by2Matrix::operator-(const Symmetric2by2Matrix& other) const {
  Symmetric2by2Matrix result(*this);
  return result -= other;
}

Symmetric2by2Matrix& Symmetric2by2Matrix::operator-=(const Symmetric2by2Matrix& other) {
  for (int i = 0; i < 3; ++i) m_[i] -= other.m_[i];
  return *this;
}

Symmetric2by2Matrix& Symmetric2by2Matrix::operator*=(double factor) {
  for (double& e : m_) e *= factor;
  return *this;
}

Symmetric2by2Matrix Symmetric2by2Matrix::operator/(double divisor) const {
  Symmetric2by2Matrix result(*this);
  return result /= divisor;
}

Symmetric2by2Matrix& Symmetric2by2Matrix::operator/=(double divisor) {
  for (double& e : m_) e /= divisor;
  return *this;
}

bool Symmetric2by2Matrix::operator==(const Symmetric2by2Matrix& other) const {
  return m_[0] == other.m_[0] && m_[1] == other.m_[1] && m_[2] == other.m_[2];
}

}  // namespace lodestack
