// Gauss-Legendre, Gauss-Hermite and Gauss-Laguerre rules by the method of
// Golub and Welsch, and the integrals built on them.
#include <algorithm>
#include <cfloat>
#include <cmath>
#include <numeric>
#include <utility>
#include <vector>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/RootsAndOptima.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace {

// Eigenvalues of the symmetric tridiagonal matrix with diagonal d and
// off-diagonal e (e[i] joins rows i and i + 1), and the first component of
// each normalised eigenvector, by the implicit QL method with Wilkinson
// shifts (the tql2 algorithm of EISPACK; Bowdler, Martin, Reinsch and
// Wilkinson, Numer. Math. 11 (1968) 293). Only the first row of the
// eigenvector matrix is carried through the rotations, which is all Golub
// and Welsch need: O(n^2) work. Ascending on return; false when an
// eigenvalue takes more than 60 iterations.
bool tridiagonalEigen(std::vector<double>& d, std::vector<double> e, std::vector<double>& z) {
  const std::size_t n = d.size();
  z.assign(n, 0.0);
  if (n == 0) return true;
  z[0] = 1.0;
  e.resize(n, 0.0);
  e[n - 1] = 0.0;
  for (std::size_t l = 0; l < n; ++l) {
    for (int iter = 0;; ++iter) {
      std::size_t m = l;
      for (; m + 1 < n; ++m) {
        const double dd = std::fabs(d[m]) + std::fabs(d[m + 1]);
        if (std::fabs(e[m]) <= DBL_EPSILON * dd) break;
      }
      if (m == l) break;
      if (iter == 60) return false;
      double g = (d[l + 1] - d[l]) / (2.0 * e[l]);
      double r = std::hypot(g, 1.0);
      g = d[m] - d[l] + e[l] / (g + std::copysign(r, g));
      double s = 1.0, c = 1.0, p = 0.0;
      bool deflated = false;
      for (std::size_t i = m; i-- > l;) {
        const double f = s * e[i], b = c * e[i];
        r = std::hypot(f, g);
        e[i + 1] = r;
        if (r == 0.0) {
          // Underflow: the matrix splits here; start over on the part.
          d[i + 1] -= p;
          e[m] = 0.0;
          deflated = true;
          break;
        }
        s = f / r;
        c = g / r;
        g = d[i + 1] - p;
        r = (d[i] - g) * s + 2.0 * c * b;
        p = s * r;
        d[i + 1] = g + p;
        g = c * r - b;
        const double zf = z[i + 1];
        z[i + 1] = s * z[i] + c * zf;
        z[i] = c * z[i] - s * zf;
      }
      if (deflated) continue;
      d[l] -= p;
      e[l] = g;
      e[m] = 0.0;
    }
  }
  std::vector<std::size_t> order(n);
  std::iota(order.begin(), order.end(), 0);
  std::stable_sort(order.begin(), order.end(),
                   [&](std::size_t i, std::size_t j) { return d[i] < d[j]; });
  std::vector<double> ds(n), zs(n);
  for (std::size_t i = 0; i < n; ++i) {
    ds[i] = d[order[i]];
    zs[i] = z[order[i]];
  }
  d.swap(ds);
  z.swap(zs);
  return true;
}

// Nodes and weights of the rule with the given Jacobi matrix and mu0.
bool golubWelsch(std::vector<double> diagonal, const std::vector<double>& offDiagonal, double mu0,
                 std::vector<double>& nodes, std::vector<double>& weights) {
  std::vector<double> z;
  nodes.clear();
  weights.clear();
  if (!tridiagonalEigen(diagonal, offDiagonal, z)) return false;
  nodes = diagonal;
  weights.resize(z.size());
  for (std::size_t i = 0; i < z.size(); ++i) weights[i] = mu0 * z[i] * z[i];
  return true;
}

// The positive half of a symmetric rule, descending, each node and weight
// averaged with its mirror image.
void keepPositiveHalf(std::vector<double>& nodes, std::vector<double>& weights) {
  const std::size_t n = nodes.size(), h = n / 2;
  std::vector<double> x(h), w(h);
  for (std::size_t i = 0; i < h; ++i) {
    x[i] = 0.5 * (nodes[n - 1 - i] - nodes[i]);
    w[i] = 0.5 * (weights[n - 1 - i] + weights[i]);
  }
  nodes.swap(x);
  weights.swap(w);
}

// The classic 16-point Gauss-Legendre rule: positive nodes, descending.
const double kLegendre16Nodes[8] = {0.98940093499164993, 0.94457502307323258, 0.86563120238783174,
                                    0.75540440835500303, 0.61787624440264375, 0.45801677765722739,
                                    0.28160355077925891, 0.09501250983763744};
const double kLegendre16Weights[8] = {
    0.027152459411754095, 0.062253523938647893, 0.095158511682492785, 0.12462897125553387,
    0.14959598881657673,  0.16915651939500254,  0.18260341504492359,  0.1894506104550685};

double symmetricSum(double a, double b, const double* x, const double* w, std::size_t count,
                    CmRealFunction& f) {
  const double c = 0.5 * (a + b), h = 0.5 * (b - a);
  double sum = 0.0;
  for (std::size_t i = 0; i < count; ++i) sum += w[i] * (f(c + h * x[i]) + f(c - h * x[i]));
  return h * sum;
}

double weightedSum(std::vector<double> const& nodes, std::vector<double> const& weights,
                   CmRealFunction& f) {
  double sum = 0.0;
  for (std::size_t i = 0; i < nodes.size() && i < weights.size(); ++i)
    sum += weights[i] * f(nodes[i]);
  return sum;
}

}  // namespace

bool mGaussianQuadratureWeights(unsigned n, std::vector<double>& nodes,
                                std::vector<double>& weights) {
  std::vector<double> off(n > 0 ? n - 1 : 0);
  for (std::size_t i = 0; i < off.size(); ++i) {
    const double k = static_cast<double>(i + 1);
    off[i] = 0.5 / std::sqrt(1.0 - 1.0 / (4.0 * k * k));
  }
  if (!golubWelsch(std::vector<double>(n, 0.0), off, 2.0, nodes, weights)) return false;
  keepPositiveHalf(nodes, weights);
  return true;
}

bool mGaussHermiteQuadratureWeights(unsigned n, std::vector<double>& nodes,
                                    std::vector<double>& weights, bool half) {
  std::vector<double> off(n > 0 ? n - 1 : 0);
  for (std::size_t i = 0; i < off.size(); ++i) off[i] = std::sqrt(0.5 * static_cast<double>(i + 1));
  if (!golubWelsch(std::vector<double>(n, 0.0), off, std::sqrt(M_PI), nodes, weights)) return false;
  // The rule is symmetric: each pair is averaged with its mirror image, and
  // an odd rule's middle node is exactly 0.
  std::vector<double> x = nodes, w = weights;
  keepPositiveHalf(x, w);
  if (half) {
    nodes.swap(x);
    weights.swap(w);
    return true;
  }
  for (std::size_t i = 0; i < x.size(); ++i) {
    nodes[n - 1 - i] = x[i];
    nodes[i] = -x[i];
    weights[i] = weights[n - 1 - i] = w[i];
  }
  if (n % 2) nodes[n / 2] = 0.0;
  return true;
}

bool mGaussLaguerreQuadratureWeights(unsigned n, std::vector<double>& nodes,
                                     std::vector<double>& weights, double alpha) {
  nodes.clear();
  weights.clear();
  if (!(alpha > -1.0) || !std::isfinite(alpha)) return false;
  std::vector<double> diagonal(n), off(n > 0 ? n - 1 : 0);
  for (std::size_t i = 0; i < n; ++i) diagonal[i] = 2.0 * static_cast<double>(i) + 1.0 + alpha;
  for (std::size_t i = 0; i < off.size(); ++i) {
    const double k = static_cast<double>(i + 1);
    off[i] = std::sqrt(k * (k + alpha));
  }
  // Gamma(alpha + 1) beyond the doubles leaves no representable weights.
  const double logMu0 = mLogGamma(alpha + 1.0);
  if (!(logMu0 < 709.0)) return false;
  return golubWelsch(diagonal, off, std::exp(logMu0), nodes, weights);
}

double mGaussianIntegration(double a, double b, CmRealFunction& f, unsigned n) {
  if (n == 16) return symmetricSum(a, b, kLegendre16Nodes, kLegendre16Weights, 8, f);
  std::vector<double> nodes, weights;
  if (!mGaussianQuadratureWeights(n, nodes, weights)) return mGetMissingValueCode();
  return symmetricSum(a, b, nodes.data(), weights.data(), nodes.size(), f);
}

double mGaussianIntegration(double a, double b, std::vector<double> const& nodes,
                            std::vector<double> const& weights, CmRealFunction& f) {
  return symmetricSum(a, b, nodes.data(), weights.data(), std::min(nodes.size(), weights.size()),
                      f);
}

double mGaussHermiteIntegration(CmRealFunction& f, unsigned n) {
  std::vector<double> nodes, weights;
  if (!mGaussHermiteQuadratureWeights(n, nodes, weights, false)) return mGetMissingValueCode();
  return weightedSum(nodes, weights, f);
}

double mGaussHermiteIntegration(std::vector<double> const& nodes,
                                std::vector<double> const& weights, CmRealFunction& f) {
  return weightedSum(nodes, weights, f);
}

double mGaussLaguerreIntegration(CmRealFunction& f, unsigned n, double alpha) {
  std::vector<double> nodes, weights;
  if (!mGaussLaguerreQuadratureWeights(n, nodes, weights, alpha)) return mGetMissingValueCode();
  return weightedSum(nodes, weights, f);
}

double mGaussLaguerreIntegration(std::vector<double> const& nodes,
                                 std::vector<double> const& weights, CmRealFunction& f) {
  return weightedSum(nodes, weights, f);
}

}  // namespace qel
