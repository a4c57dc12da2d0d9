# oxmv_flags: how our own code is compiled. Every target of ours links it privately, so none of this
# reaches those who use the library.
add_library(oxmv_flags INTERFACE)

target_compile_options(oxmv_flags INTERFACE
  -Wall -Wextra -Wpedantic -Wconversion -Wshadow
  $<$<BOOL:${OXMV_WERROR}>:-Werror>)

# Files of 2 GiB and more have sizes also where a word has 32 bits.
target_compile_definitions(oxmv_flags INTERFACE _FILE_OFFSET_BITS=64)
# Nor do the years end in 2038 there.
target_compile_definitions(oxmv_flags INTERFACE
  $<$<EQUAL:${CMAKE_SIZEOF_VOID_P},4>:_TIME_BITS=64>)

# An index out of bounds in a standard container ends a debug build at once.
target_compile_definitions(oxmv_flags INTERFACE $<$<CONFIG:Debug>:_GLIBCXX_ASSERTIONS>)

# What distributions build with, as far as compiler and linker know it: canaries on the stack, checked
# copies (only where the compiler optimises), stacks that are grown page by page, marks at the targets
# of jumps, and tables of addresses that are bound at the start and read-only from then on.
if(OXMV_HARDEN)
  include(CheckCXXCompilerFlag)
  include(CheckLinkerFlag)
  foreach(flag IN ITEMS
      -fstack-protector-strong -fstack-clash-protection -fcf-protection
      "SHELL:-U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=2")
    string(MAKE_C_IDENTIFIER "OXMV_KNOWS${flag}" known)
    string(REPLACE "SHELL:" "" tried "${flag}")
    check_cxx_compiler_flag("${tried}" ${known})
    if(${known})
      target_compile_options(oxmv_flags INTERFACE "${flag}")
    endif()
  endforeach()
  check_linker_flag(CXX "LINKER:-z,relro,-z,now" OXMV_KNOWS_RELRO)
  if(OXMV_KNOWS_RELRO)
    target_link_options(oxmv_flags INTERFACE "LINKER:-z,relro,-z,now")
  endif()
endif()

if(OXMV_FUZZ AND NOT CMAKE_CXX_COMPILER_ID MATCHES "Clang")
  message(FATAL_ERROR "OXMV_FUZZ needs Clang; this compiler is ${CMAKE_CXX_COMPILER_ID}")
endif()

# Kept as a list of their own: whatever links a sanitized library needs them too, such as the
# consumer in tests/.
set(oxmv_sanitizer_flags "")
if(OXMV_SANITIZE)
  set(oxmv_sanitizer_flags
    -fsanitize=${OXMV_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
endif()
target_compile_options(oxmv_flags INTERFACE
  ${oxmv_sanitizer_flags} $<$<BOOL:${OXMV_FUZZ}>:-fsanitize=fuzzer-no-link>)
target_link_options(oxmv_flags INTERFACE ${oxmv_sanitizer_flags})
