# What every target of the project is compiled with.
add_library(lexicor_flags INTERFACE)
target_compile_options(lexicor_flags INTERFACE -Wall -Wextra -Wconversion -Wshadow)
if(LEXICOR_WERROR)
  target_compile_options(lexicor_flags INTERFACE -Werror)
endif()
if(LEXICOR_SANITIZE)
  # GCC's instrumented code makes this warning speak of the C++ library's own headers.
  target_compile_options(lexicor_flags INTERFACE $<$<CXX_COMPILER_ID:GNU>:-Wno-maybe-uninitialized>)
  target_compile_options(lexicor_flags INTERFACE -fsanitize=${LEXICOR_SANITIZE} -fno-sanitize-recover=all
                                                 -fno-omit-frame-pointer)
  target_link_options(lexicor_flags INTERFACE -fsanitize=${LEXICOR_SANITIZE})
endif()

# Stands behind lexicor_flags. In the programs beside the library undefined behaviour is looked for without the checks
# that the standard library multiplies: the address sanitizer sees what they would.
add_library(lexicor_tool_flags INTERFACE)
target_compile_definitions(lexicor_tool_flags INTERFACE _FILE_OFFSET_BITS=64)
if(LEXICOR_SANITIZE MATCHES undefined)
  target_compile_options(lexicor_tool_flags INTERFACE -fno-sanitize=null,alignment,object-size,vptr)
endif()

# A target that compiles headers once; others with the same flags reuse them.
function(lexicor_headers target)
  file(CONFIGURE OUTPUT ${CMAKE_CURRENT_BINARY_DIR}/headers.cpp CONTENT "")
  add_library(${target} OBJECT ${CMAKE_CURRENT_BINARY_DIR}/headers.cpp)
  target_precompile_headers(${target} PRIVATE ${ARGN})
endfunction()
