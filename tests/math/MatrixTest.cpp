// Symmetric 2 x 2 and 4 x 4 matrices and the state covariance.
#include <gtest/gtest.h>

#include <cmath>
#include <random>

#include "lodestack/math/StateEstimateCovariance.h"
#include "lodestack/math/Symmetric2by2Matrix.h"
#include "lodestack/math/Symmetric4by4Matrix.h"

using namespace lodestack;

TEST(Matrix2, InverseAndSymmetricProduct) {
  Symmetric2by2Matrix target(5.0, 6.0, 7.0);
  EXPECT_FALSE(target.invmat(Symmetric2by2Matrix(1.0, 1.0, 1.0)));
  EXPECT_EQ(target, Symmetric2by2Matrix(5.0, 6.0, 7.0)) << "a refused inverse changes nothing";

  Symmetric2by2Matrix m(4.0, 1.0, 3.0);
  ASSERT_TRUE(m.invmat(m)) << "in place";
  EXPECT_DOUBLE_EQ(m[0], 3.0 / 11.0);
  EXPECT_DOUBLE_EQ(m[1], -1.0 / 11.0);
  EXPECT_DOUBLE_EQ(m[2], 4.0 / 11.0);

  // a b a, by hand: [[2,-1],[-1,3]] [[5,.5],[.5,-2]] = [[9.5,3],[-3.5,-6.5]],
  // times [[2,-1],[-1,3]] = [[16,-.5],[-.5,-16]].
  const Symmetric2by2Matrix a(2.0, -1.0, 3.0), b(5.0, 0.5, -2.0);
  Symmetric2by2Matrix p = a;
  p.prodmat(p, b);
  EXPECT_EQ(p, Symmetric2by2Matrix(16.0, -0.5, -16.0)) << "aliased with the first argument";

  Symmetric2by2Matrix s = a + b - b;
  s *= 4.0;
  EXPECT_EQ(s / 2.0, Symmetric2by2Matrix(4.0, -2.0, 6.0));
  EXPECT_EQ(a.det(), 5.0);
}

TEST(Matrix4, LayoutInverseAndDiagonal) {
  Symmetric4by4Matrix m;
  EXPECT_FALSE(m.diagonalNonZero()) << "cleared";
  EXPECT_FALSE(Symmetric4by4Matrix(1, 0, 1, 0, 0, 0, 0, 1, 0, 0).diagonalNonZero());
  const Symmetric4by4Matrix d(1, 0, 2, 0, 0, 0, 0, 3, 0, 4);
  EXPECT_TRUE(d.diagonalNonZero());
  EXPECT_EQ(d.at(2, 2), 3.0);
  EXPECT_EQ(Symmetric4by4Matrix::index(3, 2), 8u);

  Symmetric4by4Matrix target = d;
  EXPECT_FALSE(target.invmat(Symmetric4by4Matrix()));
  // Rank 3: the last row is the sum of the first two.
  EXPECT_FALSE(target.invmat(Symmetric4by4Matrix(1, 2, 5, 0, 0, 3, 7, 1, 0, 10)));
  EXPECT_EQ(target, d) << "a refused inverse changes nothing";

  // Random covariances, some with very different scales per variable: the
  // product with the inverse, formed independently, is the identity.
  std::mt19937_64 random(11);
  std::normal_distribution<double> normal;
  for (int trial = 0; trial < 200; ++trial) {
    double g[4][4], full[4][4] = {};
    const double scale[4] = {1e-5, 1e-5, trial % 2 ? 1e3 : 1.0, trial % 2 ? 1e3 : 1.0};
    for (auto& row : g)
      for (double& e : row) e = normal(random);
    for (int i = 0; i < 4; ++i)  // G G^T, scaled, plus a little on the diagonal
      for (int j = 0; j < 4; ++j) {
        for (int k = 0; k < 4; ++k) full[i][j] += g[i][k] * g[j][k];
        full[i][j] = (full[i][j] + (i == j ? 0.1 : 0.0)) * scale[i] * scale[j];
      }
    Symmetric4by4Matrix a;
    for (int i = 0; i < 4; ++i)
      for (int j = i; j < 4; ++j) a[Symmetric4by4Matrix::index(i, j)] = full[i][j];
    Symmetric4by4Matrix inverse;
    ASSERT_TRUE(inverse.invmat(a)) << trial;
    for (int i = 0; i < 4; ++i)
      for (int j = 0; j < 4; ++j) {
        double sum = 0.0;
        for (int k = 0; k < 4; ++k) sum += full[i][k] * inverse.at(k, j);
        ASSERT_NEAR(sum * scale[j] / scale[i], i == j ? 1.0 : 0.0, 1e-9) << trial;
      }
  }

  // The state covariance loads a shape matrix into its position block only.
  StateEstimateCovariance c(1.0, 2.0, 3.0);
  c += Symmetric4by4Matrix(0, 0, 0, 0, 0, 0, 0, 5, 6, 7);
  c = ShapeMatrix(9.0, 8.0, 7.0);
  EXPECT_EQ(c, Symmetric4by4Matrix(9, 8, 7, 0, 0, 0, 0, 0, 0, 0)) << "loads the position only";
}
