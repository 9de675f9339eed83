/// \file
/// Umbrella header of libqel.
#ifndef QEL_QEL_H
#define QEL_QEL_H

#include <qel/basic_types.h>
#include <qel/contingency_table.h>
#include <qel/descriptive.h>
#include <qel/distributions.h>
#include <qel/interval.h>
#include <qel/location_tests.h>
#include <qel/sign_tests.h>
#include <qel/curve_fit.h>
#include <qel/fits.h>
#include <qel/order_statistics.h>
#include <qel/proportion_tests.h>
#include <qel/rank_tests.h>
#include <qel/random.h>
#include <qel/sampler.h>
#include <qel/summaries.h>
#include <qel/tabular_gof.h>
#include <qel/variance_tests.h>
#include <qel/variances_test.h>
#include <qel/axis_ticks.h>

/// \namespace qel
/// The exported surface of libqel. Unversioned names (the distribution
/// functions, the frame switches, the sampler and the contingency table) sit
/// here; the versioned layers below keep the signatures of older hosts.

/// \namespace qel::v0
/// The first versioned layer: location, sign, rank, proportion and variance
/// tests with their records, the interval quantile objects, the exponential
/// and Weibull goodness of fit, and the normal range distribution.

/// \namespace qel::v1
/// The second versioned layer: descriptive and order statistics, summaries,
/// the symmetric interval maker, the runs test, the normal and lognormal
/// goodness of fit, the curve fit and Bonett's kurtosis estimate.

/// \namespace qel::v2
/// Maximum-likelihood parameter fits.

/// \namespace qel::deprecated
/// Interfaces kept for old callers: the axis tick search.

#endif
