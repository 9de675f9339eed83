// Power of two-level factorial and Plackett-Burman designs, and of general
// full factorial (and one-way) designs, through the noncentral F test of an
// effect. The work lies in the error degrees of freedom: blocks confounded
// with effects, center points in or out of the model, omitted terms.
#ifndef QEL_SRC_BASIC_STATISTICS_POWERFACTORIAL_H
#define QEL_SRC_BASIC_STATISTICS_POWERFACTORIAL_H

#include <vector>

#include "basic_statistics/Power.h"
#include "basic_statistics/PowerUtilities.h"

namespace qel {

// The largest number of blocks of a two-level design with these factors and
// runs; 0 for a combination that has none.
unsigned GetMaxBlocks(unsigned factors, unsigned runs);

// The block df not confounded with factorial effects: 0 without blocks in
// the model, else blocks - t, t the smallest power of two with
// replicates x t a multiple of blocks.
int mGetNonConfoundedDFBlock(int replicates, int blocks, bool blocksInModel);

// The power of the F test (1 and df degrees of freedom) of an effect of a
// two-level design, df = r runsPerRep - uniqueCorners + omitted + cpDf -
// block df; missing when df <= 0.
double mFactorialCalcOnePower(int r, int blocks, int uniqueCorners, int runsPerRep, int omitted,
                              int cpDf, double level, double sigma, double effect,
                              bool blocksInModel);

// Why a row of a factorial design holds a missing or marked result; the
// host picks its message from it.
enum EErrorType {
  eNoError = 0,
  eNoErrorDF,         // the design leaves no error degrees of freedom
  eTargetNotReached,  // no replicate or center point count reaches the power
  eTooManyRuns,       // the error df pass the limit of an accurate noncentral F
  eNotComputable      // another missing input (e.g. sigma 0)
};

class CmCmndPowerFactorial : public CmCmndPower {
 public:
  CmCmndPowerFactorial();
  ~CmCmndPowerFactorial() override;

  virtual bool mComputeAndStore();
  // The effect reaching power with r replicates and c center points per
  // block.
  virtual double mComputeXForPowerAndSampleSize(double power, int r, int c);

  void mSetRunsPerRep(int runs) { mRunsPerRep = runs; }
  void mSetFactorCt(int factors) { mFactorCt = factors; }
  void mSetBlockCt(int blocks) { mBlockCt = blocks; }
  // omitted df = t + unique corners - factors - 1 (call after the runs,
  // factors and the Plackett-Burman flag are set).
  void mSetOmittedEffects(int t);
  void mSetCenterPntCt(int) {}
  void mSetCenterPntInModel(bool inModel) { mCenterPointsInModel = inModel; }
  void mSetBlocksInModel(bool inModel) { mBlocksInModel = inModel; }
  void mSetPlackettBurman(bool pb) { mPlackettBurman = pb; }
  void mSetStorageCPBlock(std::vector<double>* storage) { mStorageCPBlock = storage; }
  // The center points per block list; marks it as given.
  void mSetCenterPoints(const std::vector<int>& perBlock);
  void mSetCenterPointsGiven(bool given) { mCenterPointsGiven = given; }

  int mGetUniqueCornerPointCt() const;
  int mGetTotalCornerPointCt() const { return mRunsPerRep; }
  int mGetOmittedEffects() const { return mOmitted; }
  int mGetDFCenterPoint(int c, bool isMax) const;
  int mGetNonConfoundedDFBlock(int replicates) const;
  int mGetMinRepCt(int c) const;
  int mGetMaxRepCt(int c) const;
  int mGetMaxRepCt(int c, double effect) const;
  int mGetMinCenterPntCtPerBlock(int r) const;
  int mGetMaxCenterPntCtPerBlock(int r) const;
  int mGetRequiredCenterPointCtPerBlock(int c, bool isMax) const;
  bool mIsReplicateBlockCombinationAllowed(int r, int blocks, int cpDf) const;
  int mCalculateMinCPBlock() const;
  void mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin, double* xMax);

  // The power with r replicates and c center points per block.
  double mPowerAt(int r, int c, double effect) const;
  const std::vector<int>& mGetResultCenterPoints() const { return mResultCenterPoints; }
  const std::vector<int>& mGetResultTotalRuns() const { return mResultTotalRuns; }
  int mGetLengthOfTotalRunCt() const { return static_cast<int>(mResultTotalRuns.size()); }
  // Per stored row, its error kind; and the row numbers (from 1) of the rows
  // without error df, of those whose target is not reached, and of those
  // past the df limit.
  const std::vector<EErrorType>& mGetErrorTypes() const { return mErrorTypes; }
  const std::vector<int>& mGetNoErrorDFRows() const { return mNoErrorDFRows; }
  const std::vector<int>& mGetNotReachedRows() const { return mNotReachedRows; }
  const std::vector<int>& mGetTooManyRunsRows() const { return mTooManyRunsRows; }
  // The error kind of a row with r replicates and cp center points per block.
  EErrorType mGetErrorType(int r, int cp, double effect, double power) const;

 protected:
  void mStoreRow(int row, int r, double effect, double power, int cp, double target);
  int mSmallestReplicates(double effect, double power, int c) const;
  int mSmallestCenterPoints(double effect, double power, int r) const;

  std::vector<int> mCenterPointList;
  int mRunsPerRep;
  int mFactorCt;
  int mBlockCt;
  int mOmitted;
  int mUnusedInt;
  bool mCenterPointsGiven;
  bool mCenterPointsInModel;
  bool mBlocksInModel;
  bool mPlackettBurman;
  std::vector<double>* mStorageCPBlock;
  std::vector<int> mResultCenterPoints;
  std::vector<int> mResultTotalRuns;
  std::vector<int> mNoErrorDFRows;
  std::vector<int> mNotReachedRows;
  std::vector<int> mTooManyRunsRows;
  std::vector<EErrorType> mErrorTypes;
  bool mUnusedBool;
};

// Power minus target of a factorial design; x is the effect, or with the
// flags the replicates or the center-point df.
class CmFactorialPower : public CmRealFunction {
 public:
  CmFactorialPower(const CmCmndPowerFactorial& design, int r, int c, double effect, double target,
                   bool xIsReplicates, bool xIsCenterPoints);
  double operator()(double x) override;
  const CmCmndPowerFactorial& mDesign;
  int mR;
  int mC;
  double mEffect;
  bool mXIsReplicates;
  bool mXIsCenterPoints;
};

// Model df of a full factorial with these levels: r (blocks) or 1, plus the
// product of (level - 1) over every subset of at most order factors.
double mGetModelDF(int r, const std::vector<int>& levels, unsigned order, bool blocks);
double mGetDenomDF(int r, const std::vector<int>& levels, unsigned order, bool blocks);
// The maximum difference of means with sum of squares s, and back.
double mGetMaxDifference(double s);
double mGetSSMeans(double d);
// The F test of the groups of a general full factorial (or one-way) design.
double mOnewayCalcOnePower(int groups, int r, const std::vector<int>& levels, int order,
                           bool blocks, double level, double sigma, double ssMeans);

class CmCmndPowerGFF : public CmCmndPower {
 public:
  CmCmndPowerGFF();
  ~CmCmndPowerGFF() override;

  virtual bool mComputeAndStore();
  // The sum of squares of means reaching power with r replicates.
  double mComputeXForPowerAndSampleSize(double power, int r) const;
  // The smallest replicates reaching power with the sum of squares s.
  int mComputeXForPowerAndEffect(double power, double s) const;

  void mSetGroupCt(int groups) { mGroupCt = groups; }
  void mSetLevels(const std::vector<int>& levels) { mLevels = levels; }
  void mSetOrder(unsigned order) { mOrder = order; }
  void mSetBlocks(bool blocks) { mBlocks = blocks; }
  void mSetStorageTotalRuns(std::vector<double>* storage) { mStorageTotalRuns = storage; }
  // Effects from lists of means (their sum of squares about the grand mean,
  // per mean) or from maximum differences (d^2 / 2).
  void mCalculateEffectsFromMeans(const std::vector<std::vector<double>>& means);
  void mCalculateEffectsFromMaxDiff(const std::vector<double>& differences);
  void mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin, double* xMax);

  double mPowerAt(int r, double s) const;
  const std::vector<int>& mGetResultTotalRuns() const { return mResultTotalRuns; }

 protected:
  void mStoreTotalRuns(int row, int runs);
  bool mLevelsUsable() const;
  double mCells() const;

  int mUnusedInt;
  std::vector<double>* mStorageTotalRuns;
  bool mUnusedBool;
  int mGroupCt;
  std::vector<double> mMeans;
  std::vector<double> mDifferences;
  bool mUnusedBool2;
  unsigned mOrder;
  bool mBlocks;
  std::vector<int> mLevels;
  std::vector<int> mResultTotalRuns;
};

class CmOnewayPower : public CmRealFunction {
 public:
  CmOnewayPower(const CmCmndPowerGFF& design, int r, double ssMeans, double target,
                bool xIsReplicates);
  double operator()(double x) override;
  const CmCmndPowerGFF& mDesign;
  int mR;
  double mSS;
  bool mXIsReplicates;
};

}  // namespace qel

#endif
