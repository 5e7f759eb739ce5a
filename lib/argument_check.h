// The start of nearly every public operation: the client runs, and no pointer is null.
#pragma once

#include "hb_client/lifecycle.h"
#include "hb_global_data/state.h"

template <typename... Pointers>
bool all_given(const Pointers*... pointers) {
  return ((pointers != nullptr) && ...);
}

// Fails as hb_init() does, or with HB_EINVAL for a null pointer.
template <typename... Pointers>
Hb_Rc start_with(const Pointers*... pointers) {
  if (client_initialized != Hb_True && hb_init() != Hb_Success) {
    return Hb_Failure;
  }
  return all_given(pointers...) ? Hb_Success : fail(HB_EINVAL);
}
