# Doubles of the platform. `target_link_libraries(some_test PRIVATE platform_doubles)` puts them into the executable
# itself, where they take precedence over the platform's shared libraries.
add_library(platform_doubles OBJECT
  ${CMAKE_CURRENT_LIST_DIR}/platform_doubles.cpp
  ${CMAKE_CURRENT_LIST_DIR}/scripted_cluster.cpp
  ${CMAKE_CURRENT_LIST_DIR}/vex_doubles.cpp)
target_include_directories(platform_doubles PUBLIC ${CMAKE_CURRENT_LIST_DIR})
target_link_libraries(platform_doubles PUBLIC hb_platform_headers PRIVATE hb_options)
