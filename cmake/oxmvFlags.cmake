# oxmv_flags: how our own code is compiled. Every target of ours links it privately, so none of this
# reaches those who use the library.
add_library(oxmv_flags INTERFACE)

target_compile_options(oxmv_flags INTERFACE
  -Wall -Wextra -Wpedantic -Wconversion -Wshadow
  $<$<BOOL:${OXMV_WERROR}>:-Werror>)

# Files of 2 GiB and more have sizes also where a word has 32 bits.
target_compile_definitions(oxmv_flags INTERFACE _FILE_OFFSET_BITS=64)

# An index out of bounds in a standard container ends a debug build at once.
target_compile_definitions(oxmv_flags INTERFACE $<$<CONFIG:Debug>:_GLIBCXX_ASSERTIONS>)

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
