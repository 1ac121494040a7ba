#pragma once

#include <string>
#include <string_view>

namespace qvct {

/// An SVG picture as it is drawn: rectangles, upright lines and texts, in pixels from the upper left corner.
class SvgDrawing {
  public:
    SvgDrawing(double width, double height);

    /// `attributes`: of the element, as they follow its name: ` font-size="16"`.
    void text(double left, double top, std::string_view content, std::string_view attributes = {});
    /// Half a pixel wide at least, so that it can be seen.
    void rectangle(double left, double top, double width, double height, std::string_view fill,
                   double opacity = 1);
    void line(double left, double top, double bottom, std::string_view colour, double width);

    /// The document; nothing can be drawn any more.
    std::string finish() &&;

  private:
    std::string svg_;
};

}  // namespace qvct
