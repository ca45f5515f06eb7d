// SPDX-License-Identifier: MIT
#include <Benchmarks/Drawing.h>

#include <fmt/os.h>

#include <array>
#include <cstddef>
#include <iterator>

namespace Varnel::Benchmarks {

Drawing::Drawing(int width, int height) {
  fmt::format_to(std::back_inserter(svg_),
                 "<svg xmlns='http://www.w3.org/2000/svg' viewBox='0 0 {0} {1}' width='{0}' "
                 "height='{1}' font-family='sans-serif' font-size='12'>\n",
                 width, height);
  area({0, 0}, width, height, "white");
}

void Drawing::text(Point place, std::string_view text, Anchor anchor) {
  constexpr std::array names = {"start", "middle", "end"};
  fmt::format_to(std::back_inserter(svg_),
                 "<text x='{:.1f}' y='{:.1f}' text-anchor='{}'>{}</text>\n", place.x, place.y,
                 names[static_cast<std::size_t>(anchor)], text);
}

void Drawing::line(const std::vector<Point>& points, std::string_view stroke) {
  fmt::format_to(std::back_inserter(svg_), "<polyline fill='none' {} points='", stroke);
  for (const Point& point : points)
    fmt::format_to(std::back_inserter(svg_), "{:.1f},{:.1f} ", point.x, point.y);
  fmt::format_to(std::back_inserter(svg_), "'/>\n");
}

void Drawing::dot(Point place) {
  fmt::format_to(std::back_inserter(svg_),
                 "<circle cx='{:.1f}' cy='{:.1f}' r='2.5' fill='#1c6f8c'/>\n", place.x, place.y);
}

void Drawing::area(Point topLeft, double width, double height, std::string_view colour) {
  fmt::format_to(std::back_inserter(svg_),
                 "<rect x='{:.1f}' y='{:.1f}' width='{:.1f}' height='{:.1f}' fill='{}'/>\n",
                 topLeft.x, topLeft.y, width, height, colour);
}

void Drawing::write(const char* file) const {
  fmt::output_file(file).print("{}</svg>\n", std::string_view(svg_.data(), svg_.size()));
}

}  // namespace Varnel::Benchmarks
