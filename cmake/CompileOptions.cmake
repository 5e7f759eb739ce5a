# Warnings, sanitizers and coverage: one target that everything here links.
add_library(hb_options INTERFACE)
target_compile_options(hb_options INTERFACE -Wall -Wextra -Wconversion -Wshadow -Werror)

if(HB_SANITIZE)
  target_compile_options(hb_options INTERFACE -fsanitize=${HB_SANITIZE} -fno-sanitize-recover=all
                                              -fno-omit-frame-pointer)
  target_link_options(hb_options INTERFACE -fsanitize=${HB_SANITIZE})
endif()
if(HB_COVERAGE)
  target_compile_options(hb_options INTERFACE --coverage)
  target_link_options(hb_options INTERFACE --coverage)
endif()
