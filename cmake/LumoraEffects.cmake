# Compiles every effect source under data/ into its
# .fxal beside it, with lumora-fxc, as part of the default build. Each command has
# a depfile listing the includes, so editing an include recompiles its effects.
# lumora-fxc validates with a headless GL context (llvmpipe on a build machine).
# Sources are named relative to the repository root, as the engine names them.
file(GLOB_RECURSE LUMORA_EFFECT_SOURCES CONFIGURE_DEPENDS "${LUMORA_SOURCE_ROOT}/data/*.fx")
set(LUMORA_EFFECT_OUTPUTS)
# Under ThreadSanitizer the compiler runs Mesa's threads too; their races are the driver's
# (see tests/tsan.supp), and a report would fail the build.
set(LUMORA_FXC_LAUNCH)
if(LUMORA_TSAN)
  set(LUMORA_FXC_LAUNCH ${CMAKE_COMMAND} -E env
    "TSAN_OPTIONS=suppressions=${LUMORA_SOURCE_ROOT}/tests/tsan.supp")
endif()
# Likewise LeakSanitizer in the libFuzzer build reports the driver's own allocations at exit.
if(LUMORA_FUZZ)
  set(LUMORA_FXC_LAUNCH ${CMAKE_COMMAND} -E env "ASAN_OPTIONS=detect_leaks=0")
endif()
foreach(source IN LISTS LUMORA_EFFECT_SOURCES)
  file(RELATIVE_PATH relative "${LUMORA_SOURCE_ROOT}" "${source}")
  string(MAKE_C_IDENTIFIER "${relative}" depname)
  set(output "${source}al")
  set(depfile "${CMAKE_BINARY_DIR}/effects/${depname}.d")
  add_custom_command(OUTPUT "${output}"
    COMMAND ${LUMORA_FXC_LAUNCH} $<TARGET_FILE:lumora_fxc> "${relative}" -o "${relative}al" --depfile "${depfile}"
    DEPENDS "${source}" lumora_fxc
    DEPFILE "${depfile}"
    WORKING_DIRECTORY "${LUMORA_SOURCE_ROOT}"
    COMMENT "Compiling effect ${relative}"
    VERBATIM)
  list(APPEND LUMORA_EFFECT_OUTPUTS "${output}")
endforeach()
add_custom_target(lumora_effects ALL DEPENDS ${LUMORA_EFFECT_OUTPUTS})
