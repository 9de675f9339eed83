// A small writer of standalone SVG documents for qelcalc's pictures: shapes
// and text in pixels from the top-left corner, each with a class that the
// embedded style sheet (and a reader of the file) can find it by.
#ifndef QELCALC_SVG_H
#define QELCALC_SVG_H

#include <string>
#include <utility>
#include <vector>

namespace qelcalc {

// A linear map of data values [from0, from1] onto pixels [to0, to1].
struct LinearScale {
  double from0, from1, to0, to1;
  double operator()(double v) const { return to0 + (v - from0) * (to1 - to0) / (from1 - from0); }
};

class Svg {
 public:
  Svg(double width, double height, const std::string& styleSheet);

  void line(double x1, double y1, double x2, double y2, const std::string& cls);
  void circle(double cx, double cy, double r, const std::string& cls);
  void rect(double x, double y, double width, double height, const std::string& cls);
  void polygon(const std::vector<std::pair<double, double>>& points, const std::string& cls);
  // anchor: start, middle or end; the text is centred vertically on y and
  // turned by degrees (clockwise) about (x, y).
  void text(double x, double y, const std::string& content, const std::string& cls,
            const std::string& anchor = "middle", double degrees = 0);
  // Later shapes are clipped to the rectangle until endClip.
  void beginClip(double x, double y, double width, double height);
  void endClip();

  // The whole document; save writes it to path (a UsageError when it cannot).
  std::string document() const;
  void save(const std::string& path) const;

 private:
  std::string body_;
  std::string head_;
  int clips_ = 0;
};

// A coordinate as written: two decimals (a hundredth of a pixel).
std::string pixel(double v);

// &, <, > and quotes as entities.
std::string escapeXml(const std::string& text);

}  // namespace qelcalc

#endif
