# Sanitizer builds apply to every target of the tree, third-party tests included.
if(LUMORA_SANITIZE AND LUMORA_TSAN)
  message(FATAL_ERROR "LUMORA_SANITIZE and LUMORA_TSAN cannot be combined")
endif()
if(LUMORA_SANITIZE)
  add_compile_options(-fsanitize=address,undefined -fno-omit-frame-pointer -fno-sanitize-recover=undefined)
  add_link_options(-fsanitize=address,undefined)
endif()
if(LUMORA_TSAN)
  add_compile_options(-fsanitize=thread -fno-omit-frame-pointer)
  add_link_options(-fsanitize=thread)
endif()
# The libFuzzer build (tests/fuzz): every library the fuzz programs link is instrumented for
# coverage, so the fuzzer steers by the readers' own branches, and for AddressSanitizer and
# UndefinedBehaviorSanitizer, so a bad read or undefined arithmetic inside them is a crash.
if(LUMORA_FUZZ)
  if(NOT CMAKE_CXX_COMPILER_ID MATCHES "Clang")
    message(FATAL_ERROR "LUMORA_FUZZ needs clang (CXX=clang++); the compiler is ${CMAKE_CXX_COMPILER_ID}")
  endif()
  if(LUMORA_SANITIZE OR LUMORA_TSAN)
    message(FATAL_ERROR "LUMORA_FUZZ brings its own sanitizers: leave LUMORA_SANITIZE and LUMORA_TSAN off")
  endif()
  add_compile_options(-fsanitize=fuzzer-no-link,address,undefined -fno-sanitize-recover=undefined
    -fno-omit-frame-pointer)
  add_link_options(-fsanitize=address,undefined)
endif()

# Assertions and the GPU layer's glGetError checks in an optimised build: CI's sanitizer
# build has them on, so the suite runs once with every check the code makes.
option(LUMORA_ASSERTIONS "Keep assertions and GL error checks on in optimised builds" OFF)
if(LUMORA_ASSERTIONS)
  foreach(config RELEASE RELWITHDEBINFO MINSIZEREL)
    string(REGEX REPLACE "(^| )[-/]DNDEBUG( |$)" " " CMAKE_C_FLAGS_${config} "${CMAKE_C_FLAGS_${config}}")
    string(REGEX REPLACE "(^| )[-/]DNDEBUG( |$)" " " CMAKE_CXX_FLAGS_${config} "${CMAKE_CXX_FLAGS_${config}}")
  endforeach()
endif()
