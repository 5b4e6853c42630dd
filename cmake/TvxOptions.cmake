# Warnings, include roots and hardening shared by everything that is written here.
find_package(Threads REQUIRED)

add_library(tvx_warnings INTERFACE)
target_compile_options(tvx_warnings INTERFACE -Wall -Wextra -Wpedantic -Wconversion -Wshadow -Werror)
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU" AND CMAKE_CXX_FLAGS_DEBUG MATCHES "-fsanitize")
  # GCC's own documentation: with a sanitizer this one warns falsely (here inside <regex>). The plain builds keep it.
  target_compile_options(tvx_warnings INTERFACE -Wno-maybe-uninitialized)
endif()
if(CMAKE_CXX_COMPILER_ID STREQUAL "Clang")
  # Part of -Wconversion for clang alone; the code is written to GCC's meaning of it.
  target_compile_options(tvx_warnings INTERFACE -Wno-sign-conversion)
endif()
# Paths in log lines and assertions are relative to the source tree, never those of the build machine. Coverage needs the
# true ones to find the sources.
if(NOT CMAKE_CXX_FLAGS_DEBUG MATCHES "--coverage")
  target_compile_options(tvx_warnings INTERFACE
    "-ffile-prefix-map=${CMAKE_SOURCE_DIR}/src/=" "-ffile-prefix-map=${CMAKE_SOURCE_DIR}/="
    "-ffile-prefix-map=${CMAKE_BINARY_DIR}/=")
endif()

# Everything below src/ is included as "folder/File.h"; generated headers as "generated/File.h".
add_library(tvx_includes INTERFACE)
target_include_directories(tvx_includes INTERFACE
  "${CMAKE_SOURCE_DIR}/src" "${CMAKE_SOURCE_DIR}/include" "${CMAKE_BINARY_DIR}")

if(CMAKE_BUILD_TYPE STREQUAL "Release")
  add_compile_options(-fstack-protector-strong -U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=2)
  add_link_options(-Wl,-z,relro -Wl,-z,now -Wl,-z,noexecstack)
endif()

# tvx_add_library(name sources...): a static library of one source folder.
function(tvx_add_library name)
  add_library(${name} STATIC ${ARGN})
  target_link_libraries(${name} PUBLIC tvx_includes PRIVATE tvx_warnings)
endfunction()

# tvx_unite(target sources): with TVX_UNITY, compiles so many sources of the target at once. For targets whose sources all
# read the same large headers of libraries, where a build from nothing takes half the time and one after an edit longer.
function(tvx_unite target sources)
  if(TVX_UNITY)
    set_target_properties(${target} PROPERTIES UNITY_BUILD ON UNITY_BUILD_BATCH_SIZE ${sources})
  endif()
endfunction()

# tvx_link_provider_library(target exports): what makes a shared library one that a CIM server loads. The version script
# `exports` names what leaves it and hides the rest.
function(tvx_link_provider_library target exports)
  target_link_libraries(${target} PRIVATE tvx_warnings Threads::Threads ${CMAKE_DL_LIBS})
  target_link_options(${target} PRIVATE
    "LINKER:--version-script=${exports}" LINKER:--no-undefined LINKER:--as-needed)
  set_target_properties(${target} PROPERTIES LINK_DEPENDS "${exports}")
endfunction()
