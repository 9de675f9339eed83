// Umbrella header of libqel.
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
#include <qel/rank_tests.h>
#include <qel/random.h>
#include <qel/sampler.h>
#include <qel/summaries.h>
#include <qel/tabular_gof.h>
#include <qel/axis_ticks.h>

#endif
