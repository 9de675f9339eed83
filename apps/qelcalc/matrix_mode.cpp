// Matrix mode: a square matrix read one row a line (numbers separated by
// blanks or commas) from a file or stdin, and its LU factors, determinant,
// inverse, Cholesky factor or eigensystem. A singular matrix is an answer:
// one line on stdout. Bad shapes are usage errors.
#include "matrix_mode.h"

#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "cli.h"
#include "utilities/MatrixLibrary/matrix_functions.h"
#include "utilities/MatrixLibrary/matrix_ludecomposition.h"

namespace qelcalc {

namespace {

using qel::matrix_library::Mat;

Mat readMatrix(const std::string& path) {
  std::ifstream file;
  std::istream& in = openInput(path, file);
  std::vector<double> values;
  int columns = -1;
  int rows = 0;
  std::string line;
  for (int lineNumber = 1; std::getline(in, line); ++lineNumber) {
    for (char& c : line)
      if (c == ',' || c == '\t' || c == '\r') c = ' ';
    std::istringstream words(line);
    std::string word;
    int count = 0;
    while (words >> word) {
      values.push_back(parseNumber(word, "line " + std::to_string(lineNumber)));
      ++count;
    }
    if (count == 0) continue;
    if (columns >= 0 && count != columns)
      throw UsageError("line " + std::to_string(lineNumber) + " has " + std::to_string(count) +
                       " numbers, the first row " + std::to_string(columns));
    columns = count;
    ++rows;
  }
  if (in.bad()) throw UsageError("error while reading '" + path + "'");
  if (rows == 0) throw UsageError("no matrix in '" + path + "'");
  if (rows != columns)
    throw UsageError("the matrix is " + std::to_string(rows) + " by " + std::to_string(columns) +
                     "; a square matrix is needed");
  return Mat(values, columns);
}

void printRow(std::ostream& out, const std::vector<double>& row) {
  for (std::size_t k = 0; k < row.size(); ++k) out << (k ? " " : "") << formatNumber(row[k]);
  out << "\n";
}

void printMatrix(std::ostream& out, const Mat& a) {
  for (int i = 0; i < a.rowCount(); ++i) printRow(out, a.getRowVector(i));
}

qel::matrix_library::SMat symmetric(const Mat& a) {
  try {
    return a.ConvertToSmatrix();
  } catch (const qel::matrix_library::MatrixException&) {
    throw UsageError("the matrix is not symmetric");
  }
}

int runLu(const Mat& a, std::ostream& out) {
  const qel::matrix_library::LUDecomposition lu(a);
  if (lu.singular()) {
    out << "singular matrix\n";
    return 0;
  }
  out << "permutation";
  for (int p : lu.permutation()) out << " " << p;
  out << "\nparity " << formatNumber(lu.parity()) << "\n";
  printMatrix(out, lu.factors());
  return 0;
}

int runEigen(const Mat& a, std::ostream& out) {
  std::vector<double> values;
  Mat vectors;
  const int failed = qel::matrix_library::EigenSystems(Mat(symmetric(a)), values, vectors);
  // The routine's 0 stands for success and for a failure at the first
  // index; a 1 by 1 or converged system has finite values.
  if (failed != 0) {
    out << "no convergence at eigenvalue " << failed << "\n";
    return 0;
  }
  out << "values";
  for (double v : values) out << " " << formatNumber(v);
  out << "\n";
  printMatrix(out, vectors);
  return 0;
}

}  // namespace

void printMatrixUsage(std::ostream& out) {
  out << "  qelcalc matrix lu|det|inv|chol|eigen FILE|-\n"
         "    Reads a square matrix, one row a line, and writes: lu the permutation, the\n"
         "    parity and the packed factors; det the determinant; inv the inverse; chol\n"
         "    the upper factor U with U'U = A; eigen the values ascending, then the\n"
         "    eigenvectors as columns. A singular matrix prints one line.\n";
}

int runMatrixMode(int argc, char** argv, std::ostream& out) {
  if (argc == 3 && (std::string(argv[2]) == "--help" || std::string(argv[2]) == "-h")) {
    printMatrixUsage(out);
    return 0;
  }
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (!args.options.empty() || !args.flags.empty())
    throw UsageError("matrix takes no options (see qelcalc --help)");
  if (args.positional.size() != 2)
    throw UsageError("usage: qelcalc matrix lu|det|inv|chol|eigen FILE");
  const std::string& what = args.positional[0];
  if (what != "lu" && what != "det" && what != "inv" && what != "chol" && what != "eigen")
    throw UsageError("unknown matrix operation '" + what + "'");
  const Mat a = readMatrix(args.positional[1]);
  if (what == "lu") return runLu(a, out);
  if (what == "eigen") return runEigen(a, out);
  if (what == "det") {
    double det = 0.0;
    out << (qel::matrix_library::determinant(a, &det) ? formatNumber(det) : "singular matrix")
        << "\n";
    return 0;
  }
  if (what == "inv") {
    Mat inv;
    if (qel::matrix_library::inverse(a, &inv)) {
      printMatrix(out, inv);
    } else {
      out << "singular matrix\n";
    }
    return 0;
  }
  int failed = -1;
  double residual = 0.0;
  const auto u = qel::matrix_library::CholeskyDecomp(
      qel::matrix_library::SmatrixToUTmatrix(symmetric(a)), 0, &failed, &residual);
  if (failed >= 0) {
    out << "not positive definite at row " << failed << " (residual " << formatNumber(residual)
        << ")\n";
    return 0;
  }
  printMatrix(out, Mat(u));
  return 0;
}

}  // namespace qelcalc
