// Texts of trace records. Components know only the numbers; people read what stands here.
#pragma once

#include <cstdint>
#include <span>
#include <string_view>

// The text has a placeholder for each value of the record, in their order: `{}` for whatever it is, `{text}` for a data
// block that is text, `{number}` for a data block that is an integer.
struct Catalogue_Entry {
  uint32_t id;
  const char* text;
};

// Every record of the component "_HBC", by ascending id.
std::span<const Catalogue_Entry> hbc_catalogue();

// Text of a record, or null when the component or the record is not known.
const char* catalogue_text(std::string_view component, uint32_t record_id);
