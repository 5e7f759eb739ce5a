// Colour, where a terminal shows it.
#pragma once

#include <string>
#include <string_view>

namespace hbctl {

enum class Paint { Plain, Heading, Good, Bad, Doubtful, Notice };

class Style {
 public:
  explicit Style(bool coloured) : coloured_(coloured) {}
  std::string apply(Paint paint, std::string_view text) const;

 private:
  bool coloured_;
};

// Whether to colour what goes to `fd`. `when` is "always", "never" or "auto": on a terminal that is not dumb, unless
// NO_COLOR is set and not empty.
bool wants_colour(std::string_view when, int fd);

}  // namespace hbctl
