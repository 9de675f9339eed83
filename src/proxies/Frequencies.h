// Row frequencies as statistics see them. The base class counts every row
// once, so a data set without a frequency column and one with it go through
// the same code; CmFrequencies reads borrowed frequency columns.
#ifndef QEL_SRC_PROXIES_FREQUENCIES_H
#define QEL_SRC_PROXIES_FREQUENCIES_H

#include <vector>

#include "proxies/rows.h"

namespace qel {

class CbFrequencies {
 public:
  virtual ~CbFrequencies();
  // The frequency of the 0-based row of a column: always 1 here.
  virtual int mGetRowFrequency(int row, int column) const;
  // The summed frequency of the rows of a set: its row count here.
  virtual int mGetTotalFrequency(const CbRows& rows, int column) const;
};

class CmFrequencies : public CbFrequencies {
 public:
  CmFrequencies() = default;
  explicit CmFrequencies(const std::vector<double>* column);
  explicit CmFrequencies(const std::vector<const std::vector<double>*>& columns);
  ~CmFrequencies() override;

  // The value at the 0-based row, truncated towards zero. A row outside the
  // column, a missing column, a missing or non-finite value, or one beyond
  // the int range counts 0 rather than invoking an undefined conversion.
  int mGetRowFrequency(int row, int column) const override;
  // The sum over the rows (1-based) of the set, in int arithmetic.
  int mGetTotalFrequency(const CbRows& rows, int column) const override;

  virtual int mGetFreqColCt() const;
  virtual int mGetFreqRowCt(int column) const;
  // The borrowed column, or null for an index out of range.
  const std::vector<double>* mGetFrequencyCol(int column) const;
  // Removes from rows those whose frequency is 0, keeping the order of the
  // rest.
  void mExcludeRowsWithZeroFreq(CbRows& rows, int column) const;

 private:
  std::vector<const std::vector<double>*> mColumns;
};

}  // namespace qel

#endif
