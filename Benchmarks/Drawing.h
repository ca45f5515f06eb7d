// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>
#include <vector>

#include <fmt/format.h>

namespace Varnel::Benchmarks {

/// A picture of lines and texts, as SVG. Places are pixels from the top left corner.
///
///     Drawing drawing(300, 100);
///     drawing.text({10, 20}, "requests a minute");
///     drawing.line({{10, 90}, {290, 30}}, Drawing::curve);
///     drawing.write("docs/requests.svg");
class Drawing final {
 public:
  struct Point {
    double x = 0;
    double y = 0;
  };
  enum class Anchor { start, middle, end };

  /// Attributes of a line.
  static constexpr std::string_view curve = "stroke='#1c6f8c' stroke-width='1.5'";
  static constexpr std::string_view axis = "stroke='#999'";
  static constexpr std::string_view grid = "stroke='#e4e4e4'";
  static constexpr std::string_view comparison = "stroke='#c26a1b' stroke-dasharray='4 3'";

  Drawing(int width, int height);

  void text(Point place, std::string_view text, Anchor anchor = Anchor::start);
  void line(const std::vector<Point>& points, std::string_view stroke);
  void dot(Point place);
  void area(Point topLeft, double width, double height, std::string_view colour);

  /// Throws `std::system_error` where the file cannot be written.
  void write(const char* file) const;

 private:
  fmt::memory_buffer svg_;
};

}  // namespace Varnel::Benchmarks
