# What is installed, in components that packages are made of. What is found by place is found from the place of the
# file that looks, so that an installed tree can be moved.
include(CMakePackageConfigHelpers)
set(package_dir ${CMAKE_INSTALL_LIBDIR}/cmake/Lexicor)

install(TARGETS lexicor EXPORT LexicorTargets
        LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT library NAMELINK_COMPONENT development
        ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT development)
install(FILES include/lx.h include/nls1.h include/lexicor.hpp DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} COMPONENT development)
install(DIRECTORY include/lx DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} COMPONENT development)
install(EXPORT LexicorTargets NAMESPACE Lexicor:: DESTINATION ${package_dir} COMPONENT development)

configure_package_config_file(cmake/LexicorConfig.cmake.in LexicorConfig.cmake INSTALL_DESTINATION ${package_dir}
                              PATH_VARS CMAKE_INSTALL_DATADIR)
write_basic_package_version_file(LexicorConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/LexicorConfig.cmake ${PROJECT_BINARY_DIR}/LexicorConfigVersion.cmake
        DESTINATION ${package_dir} COMPONENT development)

set(pc_dir ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig)
file(RELATIVE_PATH pc_prefix ${pc_dir} ${CMAKE_INSTALL_PREFIX})
string(REGEX REPLACE "/$" "" pc_prefix ${pc_prefix})
foreach(place libdir includedir datadir)
  string(TOUPPER ${place} PLACE)
  file(RELATIVE_PATH pc_${place} ${CMAKE_INSTALL_PREFIX} ${CMAKE_INSTALL_FULL_${PLACE}})
endforeach()
set(pc_data "")
if(LEXICOR_TOOLS)
  set(pc_data "localedir=\${prefix}/${pc_datadir}/lexicor/locale\n")
endif()
configure_file(cmake/lexicor.pc.in lexicor.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/lexicor.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)

if(LEXICOR_TOOLS)
  install(TARGETS lexicor_cli lexicor-data lexicor-gencat RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT tools)
  install(DIRECTORY ${PROJECT_BINARY_DIR}/locale/ DESTINATION ${CMAKE_INSTALL_DATADIR}/lexicor/locale COMPONENT data)
  set(LEXICOR_ZSH_DIR ${CMAKE_INSTALL_DATADIR}/zsh/site-functions CACHE STRING "Where completion for zsh is installed")
  install(FILES completions/_lexicor DESTINATION ${LEXICOR_ZSH_DIR} COMPONENT tools)
  foreach(program lexicor lexicor-data lexicor-gencat)  # the other shells look for a file of the program's name
    install(FILES completions/lexicor.bash DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions
            RENAME ${program} COMPONENT tools)
    install(FILES completions/lexicor.fish DESTINATION ${CMAKE_INSTALL_DATADIR}/fish/vendor_completions.d
            RENAME ${program}.fish COMPONENT tools)
  endforeach()
endif()
set(LEXICOR_PYTHON_DIR lib/python3/dist-packages CACHE STRING "Where the Python module is installed; empty: nowhere")
if(LEXICOR_PYTHON_DIR)
  install(DIRECTORY bindings/python/lexicor DESTINATION ${LEXICOR_PYTHON_DIR} COMPONENT python
          FILES_MATCHING PATTERN *.py PATTERN py.typed)
endif()
if(LEXICOR_SQLITE)
  install(TARGETS lexicor_sqlite LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}/sqlite3 COMPONENT sqlite)
endif()

find_program(LEXICOR_SCDOC scdoc)
option(LEXICOR_MAN "Make and install the manual pages, where scdoc is there" ON)
if(LEXICOR_MAN AND LEXICOR_SCDOC)
  set(manuals "")
  file(GLOB pages CONFIGURE_DEPENDS man/*.scd)
  foreach(page ${pages})
    cmake_path(GET page STEM LAST_ONLY name)
    cmake_path(GET name EXTENSION LAST_ONLY section)
    string(SUBSTRING ${section} 1 1 section)
    add_custom_command(OUTPUT ${PROJECT_BINARY_DIR}/man/${name} DEPENDS ${page} VERBATIM
      COMMAND ${CMAKE_COMMAND} -E make_directory ${PROJECT_BINARY_DIR}/man
      COMMAND sh -c "exec ${LEXICOR_SCDOC} <${page} >${PROJECT_BINARY_DIR}/man/${name}")
    list(APPEND manuals ${PROJECT_BINARY_DIR}/man/${name})
    install(FILES ${PROJECT_BINARY_DIR}/man/${name} DESTINATION ${CMAKE_INSTALL_MANDIR}/man${section} COMPONENT tools)
  endforeach()
  add_custom_target(lexicor_man ALL DEPENDS ${manuals})
endif()

# Section 3 and HTML, of the headers: `cmake --build DIR --target reference`, and then they are installed too.
find_program(LEXICOR_DOXYGEN doxygen)
if(LEXICOR_DOXYGEN AND PROJECT_IS_TOP_LEVEL)
  configure_file(docs/Doxyfile.in Doxyfile @ONLY)
  add_custom_target(reference VERBATIM COMMENT "Reference of the interface: reference/html, reference/man/man3"
    COMMAND sh ${PROJECT_SOURCE_DIR}/cmake/reference.sh ${PROJECT_BINARY_DIR}/Doxyfile ${PROJECT_BINARY_DIR}/reference)
  install(DIRECTORY ${PROJECT_BINARY_DIR}/reference/man/man3 DESTINATION ${CMAKE_INSTALL_MANDIR}
          COMPONENT development OPTIONAL)
  install(DIRECTORY ${PROJECT_BINARY_DIR}/reference/html DESTINATION ${CMAKE_INSTALL_DOCDIR}
          COMPONENT development OPTIONAL)
endif()
install(FILES LICENSE README.md CHANGELOG.md SECURITY.md DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT documentation)
install(DIRECTORY examples DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT documentation)
install(DIRECTORY docs DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT documentation FILES_MATCHING
        PATTERN *.md PATTERN *.svg)

if(PROJECT_IS_TOP_LEVEL)
  add_custom_target(uninstall COMMAND ${CMAKE_COMMAND} -P ${PROJECT_SOURCE_DIR}/cmake/uninstall.cmake
                    WORKING_DIRECTORY ${PROJECT_BINARY_DIR})
endif()
