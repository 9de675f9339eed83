// qel.Sampler: one seeded uniform stream that draws NumPy arrays from the
// distribution families.
#include <qel/random.h>
#include <qel/sampler.h>

#include <memory>
#include <mutex>

#include "common.h"

namespace qelpy {

namespace {

// Owns an ISampler; the mutex keeps a sampler to one thread at a time
// while the draws run without the GIL.
class Sampler {
 public:
  explicit Sampler(double seed) {
    int code = 0;
    sampler_ = qel::MakeISampler(&code, seed, qel::kRngCombinedCongruential);
    check(code);
    if (sampler_ == nullptr) throw CodeError(qel::qelFailOutOfMemory);
  }
  ~Sampler() { qel::DeleteISampler(&sampler_); }
  Sampler(const Sampler&) = delete;
  Sampler& operator=(const Sampler&) = delete;

  double seed() {
    std::lock_guard<std::mutex> lock(mutex_);
    return sampler_->GetSeed();
  }
  void setSeed(double seed) {
    std::lock_guard<std::mutex> lock(mutex_);
    sampler_->SetSeed(seed);
  }

  // n draws of one family: draw(sampler, out, n) returns the message code.
  template <class Draw>
  py::array_t<double> draws(long long n, Draw draw) {
    py::array_t<double> out(static_cast<py::ssize_t>(checkedCount(n)));
    double* data = out.mutable_data();
    const int code = released([&] {
      std::lock_guard<std::mutex> lock(mutex_);
      return draw(*sampler_, data, static_cast<unsigned>(n));
    });
    check(code);
    return out;
  }

  py::array_t<double> discrete(long long n, py::handle values, py::handle probabilities) {
    Doubles v = column(values, "values"), p = column(probabilities, "probabilities");
    if (v.size() != p.size() || v.size() == 0) {
      throw py::value_error("values and probabilities must have one non-zero length");
    }
    const double* vd = v.data();
    const double* pd = p.data();
    const unsigned k = count(v);
    return draws(
        n, [=](qel::ISampler& s, double* o, unsigned m) { return s.Discrete(o, m, vd, pd, k); });
  }

  // Rows of a (n, dimension) array: observations of the multivariate normal.
  py::array_t<double> mvnormal(long long n, py::handle mean, py::handle covariance) {
    Doubles mu = column(mean, "mean");
    Doubles cov = numbers(covariance, "covariance");
    const auto d = static_cast<std::size_t>(mu.size());
    if (d == 0) throw py::value_error("mean must not be empty");
    if (cov.ndim() != 2 || cov.shape(0) != static_cast<py::ssize_t>(d) ||
        cov.shape(1) != static_cast<py::ssize_t>(d)) {
      throw py::value_error("covariance must be a square matrix of the mean's dimension");
    }
    // The library reads the lower triangle packed by rows.
    std::vector<double> packed;
    for (std::size_t i = 0; i < d; ++i) {
      for (std::size_t j = 0; j <= i; ++j) packed.push_back(cov.data()[i * d + j]);
    }
    py::array_t<double> out(
        {static_cast<py::ssize_t>(checkedCount(n)), static_cast<py::ssize_t>(d)});
    std::vector<double*> rows(static_cast<std::size_t>(n));
    for (std::size_t i = 0; i < rows.size(); ++i) rows[i] = out.mutable_data() + i * d;
    const double* m = mu.data();
    const int code = released([&] {
      std::lock_guard<std::mutex> lock(mutex_);
      return sampler_->MvNormal(rows.data(), static_cast<unsigned>(n), static_cast<unsigned>(d), m,
                                packed.data());
    });
    check(code);
    return out;
  }

  // Zero-based indices below population.
  py::array_t<unsigned> randomSample(unsigned population, long long n, bool replace) {
    if (!replace && static_cast<unsigned long long>(checkedCount(n)) > population) {
      throw py::value_error("without replacement the count must not exceed the population");
    }
    py::array_t<unsigned> out(static_cast<py::ssize_t>(checkedCount(n)));
    unsigned* data = out.mutable_data();
    const int code = released([&] {
      std::lock_guard<std::mutex> lock(mutex_);
      return sampler_->RandomSample(data, population, static_cast<unsigned>(n), !replace);
    });
    check(code);
    return out;
  }

 private:
  static long long checkedCount(long long n) {
    if (n < 0 || n > static_cast<long long>(std::numeric_limits<unsigned>::max())) {
      throw py::value_error("the number of draws must lie in [0, 2^32)");
    }
    return n;
  }

  qel::ISampler* sampler_ = nullptr;
  std::mutex mutex_;
};

using S = qel::ISampler;

// Binds method `name` drawing n values of a family with parameters Args.
#define QEL_DRAW(name, call, ...)                                            \
  cls.def(                                                                 \
      name,                                                                \
      [](Sampler& self, long long n, __VA_ARGS__) {                        \
        return self.draws(n, [=](S& s, double* o, unsigned m) { return call; }); \
      }

}  // namespace

void registerSampler(py::module_& m) {
  py::class_<Sampler> cls(m, "Sampler",
                          "A seeded stream of random draws. seed 0 takes a seed from the clock; "
                          "the same seed gives the same draws. The `seed` property names the "
                          "current position; setting it returns there.");
  cls.def(py::init<double>(), py::arg("seed") = 0.0)
      .def_property("seed", &Sampler::seed, &Sampler::setSeed);
  QEL_DRAW("normal", s.Normal(o, m, mean, sigma), double mean, double sigma),
      py::arg("n"), py::arg("mean") = 0.0, py::arg("sigma") = 1.0);
  QEL_DRAW("uniform", s.Uniform(o, m, low, high), double low, double high), py::arg("n"),
      py::arg("low") = 0.0, py::arg("high") = 1.0);
  QEL_DRAW("exponential", s.Exponential(o, m, scale, threshold), double scale, double threshold),
      py::arg("n"), py::arg("scale") = 1.0, py::arg("threshold") = 0.0);
  QEL_DRAW("gamma", s.Gamma(o, m, shape, scale, threshold), double shape, double scale,
           double threshold),
      py::arg("n"), py::arg("shape") = 1.0, py::arg("scale") = 1.0, py::arg("threshold") = 0.0);
  QEL_DRAW("beta", s.Beta(o, m, a, b), double a, double b), py::arg("n"), py::arg("a") = 1.0,
      py::arg("b") = 1.0);
  QEL_DRAW("chisq", s.ChiSq(o, m, df, 0.0), double df), py::arg("n"), py::arg("df") = 1.0);
  QEL_DRAW("f", s.F(o, m, df1, df2, 0.0), double df1, double df2), py::arg("n"),
      py::arg("df1") = 1.0, py::arg("df2") = 1.0);
  QEL_DRAW("t", s.T(o, m, df, noncentrality), double df, double noncentrality), py::arg("n"),
      py::arg("df") = 1.0, py::arg("noncentrality") = 0.0);
  QEL_DRAW("cauchy", s.Cauchy(o, m, location, scale), double location, double scale),
      py::arg("n"), py::arg("location") = 0.0, py::arg("scale") = 1.0);
  QEL_DRAW("laplace", s.Laplace(o, m, location, scale), double location, double scale),
      py::arg("n"), py::arg("location") = 0.0, py::arg("scale") = 1.0);
  QEL_DRAW("logistic", s.Logistic(o, m, location, scale), double location, double scale),
      py::arg("n"), py::arg("location") = 0.0, py::arg("scale") = 1.0);
  QEL_DRAW("loglogistic", s.LogLogistic(o, m, location, scale, threshold), double location,
           double scale, double threshold),
      py::arg("n"), py::arg("location") = 0.0, py::arg("scale") = 1.0,
      py::arg("threshold") = 0.0);
  QEL_DRAW("lognormal", s.LogNormal(o, m, location, scale, threshold), double location,
           double scale, double threshold),
      py::arg("n"), py::arg("location") = 0.0, py::arg("scale") = 1.0,
      py::arg("threshold") = 0.0);
  QEL_DRAW("largestextremevalue", s.LargestExtremeValue(o, m, location, scale), double location,
           double scale),
      py::arg("n"), py::arg("location") = 0.0, py::arg("scale") = 1.0);
  QEL_DRAW("smallestextremevalue", s.SmallestExtremeValue(o, m, location, scale),
           double location, double scale),
      py::arg("n"), py::arg("location") = 0.0, py::arg("scale") = 1.0);
  QEL_DRAW("lambda_", s.Lambda(o, m, lam, location, scale), double lam, double location,
           double scale),
      py::arg("n"), py::arg("lam") = 0.0, py::arg("location") = 0.0, py::arg("scale") = 1.0);
  QEL_DRAW("triangular", s.Triangular(o, m, low, mode, high), double low, double mode,
           double high),
      py::arg("n"), py::arg("low") = 0.0, py::arg("mode") = 0.5, py::arg("high") = 1.0);
  QEL_DRAW("weibull", s.Weibull(o, m, shape, scale, threshold), double shape, double scale,
           double threshold),
      py::arg("n"), py::arg("shape") = 1.0, py::arg("scale") = 1.0, py::arg("threshold") = 0.0);
  QEL_DRAW("bernoulli", s.Bernoulli(o, m, p), double p), py::arg("n"), py::arg("p") = 0.5);
  QEL_DRAW("binomial", s.Binomial(o, m, trials, p), int trials, double p), py::arg("n"),
      py::arg("trials") = 1, py::arg("p") = 0.5);
  QEL_DRAW("poisson", s.Poisson(o, m, mean), double mean), py::arg("n"), py::arg("mean") = 1.0);
  QEL_DRAW("geometric", s.Geometric(o, m, p, trials), double p, bool trials), py::arg("n"),
      py::arg("p") = 0.5, py::arg("trials") = true);
  QEL_DRAW("negbinomial", s.NegBinomial(o, m, r, p, trials), unsigned r, double p, bool trials),
      py::arg("n"), py::arg("r") = 1u, py::arg("p") = 0.5, py::arg("trials") = true);
  QEL_DRAW("hypergeometric", s.Hypergeometric(o, m, N, M, sample), int N, int M, int sample),
      py::arg("n"), py::arg("N") = 1, py::arg("M") = 1, py::arg("sample") = 1);
  QEL_DRAW("integeruniform", s.Uniform(o, m, low, high), int low, int high), py::arg("n"),
      py::arg("low") = 0, py::arg("high") = 1);
  QEL_DRAW("pareto", s.Pareto(o, m, a, b), double a, double b), py::arg("n"),
      py::arg("a") = 1.0, py::arg("b") = 1.0);
  QEL_DRAW("rayleigh", s.Rayleigh(o, m, a, b), double a, double b), py::arg("n"),
      py::arg("a") = 1.0, py::arg("b") = 1.0);
  cls.def("discrete", &Sampler::discrete, py::arg("n"), py::arg("values"), py::arg("probabilities"),
          "n draws from values with the given relative weights.");
  cls.def("mvnormal", &Sampler::mvnormal, py::arg("n"), py::arg("mean"), py::arg("covariance"),
          "n observations (rows) of the multivariate normal law.");
  cls.def("random_sample", &Sampler::randomSample, py::arg("population"), py::arg("n"),
          py::arg("replace") = false,
          "n zero-based indices below population, distinct unless replace.");
  m.def("seeder", &qel::Seeder, "A clock seed: seconds * 1e7 + microseconds.");
}

}  // namespace qelpy
