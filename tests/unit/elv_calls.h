// The ELV routines by name, for the table-driven tests: each entry runs one
// routine on a[0..3] and writes its outputs to o[0..2] (a discrete quantile
// writes k to o[0] and the fraction to o[1]). A routine with a forwarding
// wrapper is called through it.
#ifndef QEL_TESTS_ELV_CALLS_H
#define QEL_TESTS_ELV_CALLS_H

#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/elv.h>

#include <exception>
#include <functional>
#include <map>
#include <string>

#include "utilities/elv/t_internal.h"
#include "utilities/elv/wrappers.h"

namespace qeltest {

// Runs one routine on a[0..3]; returns its status (the wrapper's, or
// ELVerrno for a routine without one, or the routine's return code).
using Call = std::function<int(const double* a, double* o)>;

inline unsigned long u(double x) {
  return static_cast<unsigned long>(x);
}

template <class Routine>
int discrete(Routine routine, double* o) {
  long k = -1;
  routine(&k, &o[1]);
  o[0] = static_cast<double>(k);
  return ELVerrno;
}

template <class Routine>
int discreteWrapped(Routine routine, double* o) {
  unsigned long k = 0;
  const int status = routine(&k, &o[1]);
  o[0] = static_cast<double>(k);
  return status;
}

inline const std::map<std::string, Call>& elvCalls() {
  using namespace qel;
  static const std::map<std::string, Call> table = {
      {"beta_df",
       [](auto a, auto o) { return elv_beta_df(a[0], a[1], a[2], &o[0], &o[1], &o[2]); }},
      {"beta_Iabx", [](auto a, auto o) { return beta_Iabx(&o[0], a[0], a[1], a[2]); }},
      {"beta_Jabx", [](auto a, auto o) { return beta_Jabx(&o[0], a[0], a[1], a[2]); }},
      {"beta_J_complete", [](auto a, auto o) { return beta_J_complete(&o[0], a[0], a[1], a[2]); }},
      {"beta_ncdf",
       [](auto a, auto o) { return elv_beta_ncdf(a[0], a[1], a[2], a[3], &o[0], &o[1]); }},
      {"beta_ncdf2",
       [](auto a, auto o) { return beta_ncdf2(a[0], a[1], a[2], a[3], &o[0], &o[1]), ELVerrno; }},
      {"beta_lower_quant",
       [](auto a, auto o) { return elv_beta_lower_quant(a[0], a[1], a[2], o); }},
      {"beta_upper_quant",
       [](auto a, auto o) { return elv_beta_upper_quant(a[0], a[1], a[2], o); }},
      {"binomial_df",
       [](auto a, auto o) { return elv_binomial_df(u(a[0]), u(a[1]), a[2], &o[0], &o[1], &o[2]); }},
      {"binomial_lower_quant",
       [](auto a, auto o) {
         return discrete([&](long* k, double* f) { binomial_lower_quant(a[0], a[1], a[2], k, f); },
                         o);
       }},
      {"binomial_upper_quant",
       [](auto a, auto o) {
         return discrete([&](long* k, double* f) { binomial_upper_quant(a[0], a[1], a[2], k, f); },
                         o);
       }},
      {"F_df", [](auto a, auto o) { return elv_F_df(a[0], a[1], a[2], &o[0], &o[1]); }},
      {"F_ncdf", [](auto a, auto o) { return elv_F_ncdf(a[0], a[1], a[2], a[3], &o[0], &o[1]); }},
      {"F_lower_quant", [](auto a, auto o) { return elv_F_lower_quant(a[0], a[1], a[2], o); }},
      {"F_upper_quant", [](auto a, auto o) { return elv_F_upper_quant(a[0], a[1], a[2], o); }},
      {"gamma_df", [](auto a, auto o) { return elv_gamma_df(a[0], a[1], &o[0], &o[1], &o[2]); }},
      {"gamma_ncdf", [](auto a, auto o) { return elv_gamma_ncdf(a[0], a[1], a[2], &o[0], &o[1]); }},
      {"gamma_lower_quant", [](auto a, auto o) { return elv_gamma_lower_quant(a[0], a[1], o); }},
      {"gamma_upper_quant", [](auto a, auto o) { return elv_gamma_upper_quant(a[0], a[1], o); }},
      {"chi2_df", [](auto a, auto o) { return elv_chi2_df(a[0], a[1], &o[0], &o[1], &o[2]); }},
      {"chi2_ncdf", [](auto a, auto o) { return elv_chi2_ncdf(a[0], a[1], a[2], &o[0], &o[1]); }},
      {"chi2_upper_quant", [](auto a, auto o) { return elv_chi2_upper_quant(a[0], a[1], o); }},
      {"chi2_lower_quant", [](auto a, auto o) { return elv_chi2_lower_quant(a[0], a[1], o); }},
      {"poisson_df",
       [](auto a, auto o) { return elv_poisson_df(u(a[0]), a[1], &o[0], &o[1], &o[2]); }},
      {"poisson_lower_quant",
       [](auto a, auto o) {
         return discreteWrapped(
             [&](unsigned long* k, double* f) { return elv_poisson_lower_quant(a[0], a[1], k, f); },
             o);
       }},
      {"poisson_upper_quant",
       [](auto a, auto o) {
         return discreteWrapped(
             [&](unsigned long* k, double* f) { return elv_poisson_upper_quant(a[0], a[1], k, f); },
             o);
       }},
      {"normal_df", [](auto a, auto o) { return elv_normal_df(a[0], &o[0], &o[1]); }},
      {"normal_upper_quant", [](auto a, auto o) { return elv_normal_upper_quant(a[0], o); }},
      {"normal_lower_quant", [](auto a, auto o) { return elv_normal_lower_quant(a[0], o); }},
      {"inv_normal_df", [](auto a, auto o) { return elv_inv_normal_df(a[0], o); }},
      {"inv_normal_df0", [](auto a, auto o) { return o[0] = inv_normal_df0(a[0]), ELVerrno; }},
      {"t_df", [](auto a, auto o) { return elv_t_df(a[0], a[1], &o[0], &o[1]); }},
      {"t_ncdf", [](auto a, auto o) { return elv_t_ncdf(a[0], a[1], a[2], &o[0], &o[1]); }},
      {"t_lower_quant", [](auto a, auto o) { return elv_t_lower_quant(a[0], a[1], o); }},
      {"t_upper_quant", [](auto a, auto o) { return elv_t_upper_quant(a[0], a[1], o); }},
      {"t_expansion_approx",
       [](auto a, auto o) { return o[0] = t_expansion_approx(a[0], a[1], a[2]), ELVerrno; }},
      {"t_saddle_approx",
       [](auto a, auto o) { return o[0] = t_saddle_approx(a[0], a[1], a[2]), ELVerrno; }},
      {"Tha_c", [](auto a, auto o) { return Tha_c(&o[0], a[0], a[1]); }},
      {"hypergeo_df",
       [](auto a, auto o) {
         return elv_hypergeo_df(u(a[0]), u(a[1]), u(a[2]), u(a[3]), &o[0], &o[1], &o[2]);
       }},
      {"hypergeo_lower_quant",
       [](auto a, auto o) {
         return discreteWrapped(
             [&](unsigned long* k, double* f) {
               return elv_hypergeo_lower_quant(a[0], u(a[1]), u(a[2]), u(a[3]), k, f);
             },
             o);
       }},
      {"hypergeo_upper_quant",
       [](auto a, auto o) {
         return discreteWrapped(
             [&](unsigned long* k, double* f) {
               return elv_hypergeo_upper_quant(a[0], u(a[1]), u(a[2]), u(a[3]), k, f);
             },
             o);
       }},
  };
  return table;
}

// Runs a routine in the armed floating-point state, with the error state
// cleared and the outputs at -7; a trap fails the test.
inline int runArmed(const Call& call, const double* a, double* o, const std::string& where) {
  o[0] = o[1] = o[2] = -7.0;
  ELVerrno = 0;
  ELVmethod = ELVsteps1 = ELVsteps2 = -99;
  int status = -1;
  qel::SetLynFpuStates();
  try {
    status = call(a, o);
  } catch (const std::exception& e) {
    ADD_FAILURE() << where << ": trap " << e.what();
  }
  qel::ResetFpuStates();
  return status;
}

}  // namespace qeltest

#endif
