if(QN_SANITIZE AND QN_TSAN)
  message(FATAL_ERROR "QN_SANITIZE and QN_TSAN cannot be combined")
endif()
if(QN_SANITIZE)
  add_compile_options(-fsanitize=address,undefined -fno-omit-frame-pointer -fno-sanitize-recover=undefined)
  add_link_options(-fsanitize=address,undefined)
  if(CMAKE_CXX_COMPILER_ID MATCHES "Clang")
    # A C program linking the C++ driver library needs the C++ half of clang's
    # UBSan runtime (type checks of dynamic types), which clang links only
    # into C++ programs unless asked.
    add_link_options($<$<LINK_LANGUAGE:C>:-fsanitize-link-c++-runtime> $<$<LINK_LANGUAGE:C>:-lstdc++>)
  endif()
endif()
if(QN_TSAN)
  add_compile_options(-fsanitize=thread -fno-omit-frame-pointer)
  add_link_options(-fsanitize=thread)
endif()
# clang links its sanitizer runtime into executables only: a shared library's
# references to it are resolved when a program loads the library, so such a
# library cannot be linked with --no-undefined.
set(QN_LINK_NO_UNDEFINED -Wl,--no-undefined)
if((QN_SANITIZE OR QN_TSAN) AND CMAKE_CXX_COMPILER_ID MATCHES "Clang")
  set(QN_LINK_NO_UNDEFINED "")
endif()
