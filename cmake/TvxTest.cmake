# tvx_add_test(name TIER unit|provider|fault|concurrency|client SOURCES ... [LIBS ...] [DEPENDS ...]
#              [ENVIRONMENT ...] [TIMEOUT seconds])
# One GoogleTest program, one ctest entry, labelled with its tier.
if(TVX_BUILD_TESTS)
  find_package(GTest REQUIRED)
endif()

# Built by the ThreadSanitizer stage: what the concurrency tier needs and no more.
add_custom_target(tvx_concurrency_tests)

function(tvx_add_test name)
  cmake_parse_arguments(T "" "TIER;TIMEOUT" "SOURCES;LIBS;DEPENDS;ENVIRONMENT" ${ARGN})
  if(NOT T_TIER)
    message(FATAL_ERROR "tvx_add_test(${name}): TIER is missing")
  endif()
  if(NOT T_TIMEOUT)
    set(T_TIMEOUT 300)
  endif()
  add_executable(${name} ${T_SOURCES})
  # What is tested is optimised as it ships; the tests themselves are compiled for a short build.
  target_compile_options(${name} PRIVATE $<$<CONFIG:Release>:-O1>)
  target_link_libraries(${name} PRIVATE ${T_LIBS} tvx_includes tvx_warnings GTest::gmock GTest::gtest_main
                        Threads::Threads)
  if(T_DEPENDS)
    add_dependencies(${name} ${T_DEPENDS})
  endif()
  if("concurrency" IN_LIST T_TIER)
    add_dependencies(tvx_concurrency_tests ${name})
  endif()
  add_test(NAME ${name} COMMAND ${name})
  set_tests_properties(${name} PROPERTIES LABELS ${T_TIER} TIMEOUT ${T_TIMEOUT})
  if(T_ENVIRONMENT)
    set_tests_properties(${name} PROPERTIES ENVIRONMENT "${T_ENVIRONMENT}")
  endif()
endfunction()
