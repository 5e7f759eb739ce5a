// Memory as a small machine has it: a frame that claims more than the largest packet by far finds none. A short
// quarantine and short stacks keep a run fast; ASAN_OPTIONS overrides each.
extern "C" const char* __asan_default_options() {
  return "allocator_may_return_null=1:max_allocation_size_mb=32:quarantine_size_mb=8:malloc_context_size=6:"
         "detect_stack_use_after_return=0";
}
