#include "VEX_HBC_trace.h"

int hbc_trace_inited = 0;
uint32_t num_categories = hbc_trace_category_count;
uint8_t hbc_trace_detail_levels[hbc_trace_category_count] = {};
const tr_category hbc_trace_categories[hbc_trace_category_count] = {
    {Trace_Errors, "Errors", 0, 0},
    {Trace_Info, "Info", 1, 0},
    {Trace_Debug, "Debug", 2, 0},
};
tr_file_token pTokens[hbc_trace_category_count] = {};

void hbc_initialize_trace_once() {
  if (hbc_trace_inited == 0) {
    tr_ms_register_component_1(hbc_trace_component, hbc_trace_detail_levels, hbc_trace_categories, num_categories,
                               pTokens);
    hbc_trace_inited = 1;
  }
}
