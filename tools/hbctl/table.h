// Aligned columns under a heading.
#pragma once

#include <string>
#include <vector>

#include "style.h"

namespace hbctl {

enum class Align { Left, Right };

struct Column {
  std::string heading;
  Align align = Align::Left;
};

struct Cell {
  std::string text;
  Paint paint = Paint::Plain;
};

class Table {
 public:
  explicit Table(std::vector<Column> columns) : columns_(std::move(columns)) {}

  // Missing cells are empty.
  void add(std::vector<Cell> row);

  // Every line ends with a line feed, none with a space.
  std::string render(const Style& style) const;

 private:
  std::vector<size_t> widths() const;
  std::string line(const std::vector<Cell>& cells, const std::vector<size_t>& widths, const Style& style) const;

  std::vector<Column> columns_;
  std::vector<std::vector<Cell>> rows_;
};

}  // namespace hbctl
