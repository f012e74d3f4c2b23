#pragma once

#include "orbek/image.h"

#include <string>

/// Pieces of pages that need nothing beside them.

namespace Orbek::Tool::Html {

/// A whole page, with a style of its own after the common one.
std::string page(const std::string& title, const std::string& style, const std::string& body);

/// Text as it stands in a page.
std::string escaped(const std::string& text);
/// A coordinate or a percentage.
std::string number(double value);
/// A picture inside the page, as JPEG.
std::string dataUrl(const Image& image);

/// A short word on a coloured plate. @param kind pass, fail, unmet or none
std::string verdict(const char* kind, const std::string& text);
/// A shape of a drawing with a dark edge, so that it is seen on any picture. @param kind head, eye or place
std::string outlined(const std::string& shape, const char* kind);
std::string rectangle(double x0, double y0, double x1, double y1);
std::string circle(double x, double y, double radius);

} // namespace Orbek::Tool::Html
