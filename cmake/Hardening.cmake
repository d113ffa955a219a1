# What makes an error of the programs hard to use by somebody else. tests/packaging/HardeningTest.cpp asserts
# each on what is installed.
include(CheckCXXCompilerFlag)

add_compile_options(-fstack-protector-strong)
foreach(flag IN ITEMS -ftrivial-auto-var-init=zero -fcf-protection=full)
  # Not every compiler, and not every processor, has these.
  string(MAKE_C_IDENTIFIER "has${flag}" known)
  check_cxx_compiler_flag(${flag} ${known})
  if(${known})
    add_compile_options(${flag})
  endif()
endforeach()

# The C library checks sizes only where the compiler optimises; the sanitizers check them themselves.
if(NOT CMAKE_CXX_FLAGS MATCHES "-fsanitize")
  set(fortified -U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=3)
endif()
add_compile_options("$<$<NOT:$<CONFIG:Debug>>:${fortified}>")

# Every symbol is found when a program starts, and what names their places is read-only from then on.
add_link_options(-Wl,-z,relro,-z,now,-z,noexecstack)
