#include "table.h"

#include <algorithm>

namespace hbctl {
namespace {

constexpr size_t kGap = 2;

// Characters that a terminal shows: UTF-8 continuation bytes take no place.
size_t display_width(const std::string& text) {
  return static_cast<size_t>(
      std::count_if(text.begin(), text.end(), [](char c) { return (static_cast<unsigned char>(c) & 0xC0) != 0x80; }));
}

}  // namespace

void Table::add(std::vector<Cell> row) {
  row.resize(columns_.size());
  rows_.push_back(std::move(row));
}

std::vector<size_t> Table::widths() const {
  std::vector<size_t> result;
  for (const Column& column : columns_) result.push_back(display_width(column.heading));
  for (const auto& row : rows_)
    for (size_t i = 0; i < row.size(); ++i) result[i] = std::max(result[i], display_width(row[i].text));
  return result;
}

std::string Table::line(const std::vector<Cell>& cells, const std::vector<size_t>& widths, const Style& style) const {
  std::string text;
  size_t spaces = 0;
  for (size_t i = 0; i < cells.size(); ++i) {
    const size_t filler = widths[i] - display_width(cells[i].text);
    const bool right = columns_[i].align == Align::Right;
    spaces += right ? filler : 0;
    if (!cells[i].text.empty()) {
      text.append(spaces, ' ').append(style.apply(cells[i].paint, cells[i].text));
      spaces = 0;
    }
    spaces += (right ? 0 : filler) + kGap;
  }
  return text + '\n';
}

std::string Table::render(const Style& style) const {
  const std::vector<size_t> column_widths = widths();
  std::vector<Cell> headings;
  for (const Column& column : columns_) headings.push_back({column.heading, Paint::Heading});
  std::string text = line(headings, column_widths, style);
  for (const auto& row : rows_) text += line(row, column_widths, style);
  return text;
}

}  // namespace hbctl
