#include "svg.h"

#include <cmath>
#include <cstdio>
#include <fstream>

#include "cli.h"

namespace qelcalc {

std::string pixel(double v) {
  char buffer[32];
  std::snprintf(buffer, sizeof buffer, "%.2f", std::isfinite(v) ? v : 0.0);
  return buffer;
}

std::string escapeXml(const std::string& text) {
  std::string out;
  for (const char c : text) {
    switch (c) {
      case '&':
        out += "&amp;";
        break;
      case '<':
        out += "&lt;";
        break;
      case '>':
        out += "&gt;";
        break;
      case '"':
        out += "&quot;";
        break;
      default:
        out += c;
    }
  }
  return out;
}

Svg::Svg(double width, double height, const std::string& styleSheet) {
  head_ =
      "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
      "<svg xmlns=\"http://www.w3.org/2000/svg\" version=\"1.1\" width=\"" +
      pixel(width) + "\" height=\"" + pixel(height) + "\" viewBox=\"0 0 " + pixel(width) + " " +
      pixel(height) + "\">\n<style>\n" + styleSheet + "</style>\n<rect class=\"page\" " +
      "x=\"0\" y=\"0\" width=\"" + pixel(width) + "\" height=\"" + pixel(height) + "\"/>\n";
}

void Svg::line(double x1, double y1, double x2, double y2, const std::string& cls) {
  body_ += "<line class=\"" + cls + "\" x1=\"" + pixel(x1) + "\" y1=\"" + pixel(y1) + "\" x2=\"" +
           pixel(x2) + "\" y2=\"" + pixel(y2) + "\"/>\n";
}

void Svg::circle(double cx, double cy, double r, const std::string& cls) {
  body_ += "<circle class=\"" + cls + "\" cx=\"" + pixel(cx) + "\" cy=\"" + pixel(cy) + "\" r=\"" +
           pixel(r) + "\"/>\n";
}

void Svg::rect(double x, double y, double width, double height, const std::string& cls) {
  body_ += "<rect class=\"" + cls + "\" x=\"" + pixel(x) + "\" y=\"" + pixel(y) + "\" width=\"" +
           pixel(width) + "\" height=\"" + pixel(height) + "\"/>\n";
}

void Svg::polygon(const std::vector<std::pair<double, double>>& points, const std::string& cls) {
  body_ += "<polygon class=\"" + cls + "\" points=\"";
  for (std::size_t i = 0; i < points.size(); ++i)
    body_ += (i ? " " : "") + pixel(points[i].first) + "," + pixel(points[i].second);
  body_ += "\"/>\n";
}

void Svg::text(double x, double y, const std::string& content, const std::string& cls,
               const std::string& anchor, double degrees) {
  const std::string turn = degrees == 0 ? std::string()
                                        : " transform=\"rotate(" + pixel(degrees) + " " + pixel(x) +
                                              " " + pixel(y) + ")\"";
  body_ += "<text class=\"" + cls + "\" x=\"" + pixel(x) + "\" y=\"" + pixel(y) +
           "\" text-anchor=\"" + anchor + "\" dominant-baseline=\"middle\"" + turn + ">" +
           escapeXml(content) + "</text>\n";
}

void Svg::beginClip(double x, double y, double width, double height) {
  const std::string id = "clip" + std::to_string(++clips_);
  body_ += "<clipPath id=\"" + id + "\"><rect x=\"" + pixel(x) + "\" y=\"" + pixel(y) +
           "\" width=\"" + pixel(width) + "\" height=\"" + pixel(height) + "\"/></clipPath>\n" +
           "<g clip-path=\"url(#" + id + ")\">\n";
}

void Svg::endClip() {
  body_ += "</g>\n";
}

std::string Svg::document() const {
  return head_ + body_ + "</svg>\n";
}

void Svg::save(const std::string& path) const {
  std::ofstream file(path, std::ios::binary);
  if (!file) throw UsageError("cannot write file '" + path + "'");
  file << document();
  if (!file.flush()) throw UsageError("error while writing '" + path + "'");
}

}  // namespace qelcalc
