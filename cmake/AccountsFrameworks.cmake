# add_accounts_framework(NAME SOURCE...) builds a framework as a device holds it, in
# build directory/frameworks/NAME.framework/NAME.so. Of its own code it exports
# RegisterClasses and the version of the interface, nothing else.
function(add_accounts_framework name)
  add_library(${name} MODULE ${ARGN})
  set_target_properties(${name} PROPERTIES
    PREFIX ""
    CXX_VISIBILITY_PRESET hidden
    VISIBILITY_INLINES_HIDDEN ON
    LIBRARY_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/frameworks/${name}.framework)
  target_link_libraries(${name} PRIVATE accounts::framework)
  # A framework resolves all its symbols when it is loaded: what it lacks, its build finds out. The
  # sanitizers' own functions are in the program that loads it.
  if(NOT CMAKE_CXX_FLAGS MATCHES "-fsanitize")
    target_link_options(${name} PRIVATE -Wl,--no-undefined)
  endif()
endfunction()
