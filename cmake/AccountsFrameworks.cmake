# add_accounts_framework(NAME SOURCE...) builds a framework as a device holds it, in
# build directory/frameworks/NAME.framework/NAME.so. It exports RegisterClasses and the version
# of the interface, nothing else, and finds libraries that stand beside it.
function(add_accounts_framework name)
  set(exports ${CMAKE_CURRENT_FUNCTION_LIST_DIR}/AccountsFrameworks.map)
  add_library(${name} MODULE ${ARGN})
  set_target_properties(${name} PROPERTIES
    PREFIX ""
    BUILD_RPATH "$ORIGIN"
    INSTALL_RPATH "$ORIGIN"
    LINK_DEPENDS ${exports}
    LIBRARY_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/frameworks/${name}.framework)
  target_link_libraries(${name} PRIVATE accounts::framework)
  target_link_options(${name} PRIVATE -Wl,--version-script=${exports})
  # A framework resolves all its symbols when it is loaded: what it lacks, its build finds out. The
  # sanitizers' own functions are in the program that loads it.
  if(NOT CMAKE_CXX_FLAGS MATCHES "-fsanitize")
    target_link_options(${name} PRIVATE -Wl,--no-undefined)
  endif()
endfunction()
