// Pictures by graphviz's program dot.
#pragma once

#include <string>

namespace tvrcim
{

/// Draws a graph in the DOT language in one of dot's formats, such as "svg". Throws std::runtime_error where dot is not
/// installed or cannot draw it.
std::string drawnByGraphviz(const std::string& dot, const std::string& format);

} // namespace tvrcim
