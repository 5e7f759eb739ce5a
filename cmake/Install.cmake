# What a package contains: the library and its platform, headers, pages, examples, and how others find them.
include(CMakePackageConfigHelpers)

set(hb_package_dir ${CMAKE_INSTALL_LIBDIR}/cmake/hb_client)
set(hb_pkgconfig_dir ${CMAKE_INSTALL_LIBDIR}/pkgconfig)

# Where `to` lies as seen from `from`, both below the prefix or both absolute.
function(hb_relative_path variable from to)
  cmake_path(ABSOLUTE_PATH from BASE_DIRECTORY /prefix NORMALIZE)
  cmake_path(ABSOLUTE_PATH to BASE_DIRECTORY /prefix NORMALIZE)
  file(RELATIVE_PATH relative ${from} ${to})
  set(${variable} ${relative} PARENT_SCOPE)
endfunction()

# --- the library: it finds its platform beside itself, the programs find both, wherever the tree is moved to
install(TARGETS hb_client EXPORT hb_clientTargets LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
set_target_properties(hb_client PROPERTIES INSTALL_RPATH "$ORIGIN")

function(hb_program_finds_libraries program directory)
  if(TARGET ${program})
    hb_relative_path(to_libraries ${directory} ${CMAKE_INSTALL_LIBDIR})
    set_target_properties(${program} PROPERTIES INSTALL_RPATH "$ORIGIN/${to_libraries}")
  endif()
endfunction()
hb_program_finds_libraries(hbctl ${CMAKE_INSTALL_BINDIR})
hb_program_finds_libraries(hbd ${CMAKE_INSTALL_SBINDIR})

# --- headers
install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/ ${PROJECT_SOURCE_DIR}/protocol/
        DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} FILES_MATCHING PATTERN "*.h")
install(FILES ${PROJECT_SOURCE_DIR}/utils/hash.h DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/hb_client)

# --- how others find it: CMake package and pkg-config file, both relative to where they lie
install(EXPORT hb_clientTargets NAMESPACE hb_client:: DESTINATION ${hb_package_dir})
configure_package_config_file(${CMAKE_CURRENT_LIST_DIR}/hb_clientConfig.cmake.in
  ${PROJECT_BINARY_DIR}/hb_clientConfig.cmake INSTALL_DESTINATION ${hb_package_dir})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/hb_clientConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/hb_clientConfig.cmake ${PROJECT_BINARY_DIR}/hb_clientConfigVersion.cmake
        DESTINATION ${hb_package_dir})

hb_relative_path(HB_PREFIX_FROM_PKGCONFIG ${hb_pkgconfig_dir} .)
configure_file(${CMAKE_CURRENT_LIST_DIR}/hb_client.pc.in ${PROJECT_BINARY_DIR}/hb_client.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/hb_client.pc DESTINATION ${hb_pkgconfig_dir})

# --- manual pages: each name of a page's NAME section opens that page
function(hb_install_manual page)
  cmake_path(GET page FILENAME file)
  cmake_path(GET page STEM name)
  string(REGEX MATCH "[0-9]$" section ${file})
  set(directory ${CMAKE_INSTALL_MANDIR}/man${section})
  install(FILES ${page} DESTINATION ${directory})
  set_property(DIRECTORY ${PROJECT_SOURCE_DIR} APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${page})

  file(STRINGS ${page} names REGEX "^\\.Nm [A-Za-z]")
  list(TRANSFORM names REPLACE "^\\.Nm ([A-Za-z0-9_]+).*" "\\1")
  list(REMOVE_DUPLICATES names)
  list(REMOVE_ITEM names ${name})
  foreach(link IN LISTS names)
    file(WRITE ${PROJECT_BINARY_DIR}/man/${link}.${section} ".so man${section}/${file}\n")
    install(FILES ${PROJECT_BINARY_DIR}/man/${link}.${section} DESTINATION ${directory})
  endforeach()
endfunction()

file(GLOB manual_pages CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/doc/man/*.3 ${PROJECT_SOURCE_DIR}/doc/man/*.7)
foreach(page IN LISTS manual_pages)
  hb_install_manual(${page})
endforeach()

# --- documents and examples
install(FILES ${PROJECT_SOURCE_DIR}/README.md ${PROJECT_SOURCE_DIR}/CHANGELOG.md ${PROJECT_SOURCE_DIR}/LICENSE
        DESTINATION ${CMAKE_INSTALL_DOCDIR})
install(DIRECTORY ${PROJECT_SOURCE_DIR}/examples DESTINATION ${CMAKE_INSTALL_DOCDIR})

# --- a Debian package: cpack -G DEB
set(CPACK_PACKAGE_NAME hb-client)
set(CPACK_PACKAGE_CONTACT "The libhb_client developers <root@localhost>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "Client library, daemon and command of the heartbeat service")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_GENERATOR DEB)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SECTION libs)
include(CPack)
