# Which CMPI headers to compile against: a system's set if it has a usable one, else the project's own in
# include/cmpi. Sources always write "cmpi/cmpidt.h"; a system's set is put in front of the own one by
# forwarding headers in the build folder.
#   TVX_SYSTEM_CMPI=ON     a system's headers must be there, else configuring fails
#   TVX_CMPI_INCLUDE_DIR   folder that holds cmpidt.h (found by itself in the usual places)
include(CheckCXXSourceCompiles)

# What the sources here need of a header set: the three usual files and the slot names of version 2.1.
function(tvx_check_cmpi_headers folder result)
  set(CMAKE_REQUIRED_INCLUDES "${folder}")
  set(CMAKE_REQUIRED_DEFINITIONS "-DCMPI_PLATFORM_LINUX_GENERIC_GNU")
  set(CMAKE_REQUIRED_QUIET ON)
  unset(TVX_CMPI_HEADERS_USABLE CACHE)
  check_cxx_source_compiles("
    #include <cmpidt.h>
    #include <cmpift.h>
    #include <cmpimacs.h>
    static CMPIInstanceMIFT table;
    int main() {
      CMPIBrokerFT* broker = nullptr;
      return table.enumerateInstanceNames != nullptr || table.modifyInstance != nullptr ||
             table.enumerateInstancesFiltered != nullptr || sizeof(broker->enumerateInstancesFiltered) != 8;
    }" TVX_CMPI_HEADERS_USABLE)
  set(${result} "${TVX_CMPI_HEADERS_USABLE}" PARENT_SCOPE)
endfunction()

function(tvx_forward_cmpi_headers folder)
  set(forwarding "${CMAKE_BINARY_DIR}/system_cmpi")
  foreach(header cmpidt.h cmpift.h cmpimacs.h)
    file(CONFIGURE OUTPUT "${forwarding}/cmpi/${header}"
         CONTENT "#pragma once\n#pragma GCC system_header\n#include \"@folder@/@header@\"\n" @ONLY)
  endforeach()
  target_include_directories(tvx_includes BEFORE INTERFACE "${forwarding}")
  target_include_directories(tvx_includes SYSTEM INTERFACE "${folder}")
endfunction()

find_path(TVX_CMPI_INCLUDE_DIR cmpidt.h PATH_SUFFIXES cmpi DOC "Folder of a system's CMPI headers")
set(TVX_CMPI_USABLE OFF)
if(TVX_CMPI_INCLUDE_DIR)
  tvx_check_cmpi_headers("${TVX_CMPI_INCLUDE_DIR}" TVX_CMPI_USABLE)
endif()

# A system's headers ask for the platform to be named; the own ones do not care.
target_compile_definitions(tvx_includes INTERFACE CMPI_PLATFORM_LINUX_GENERIC_GNU)

if(TVX_CMPI_USABLE)
  message(STATUS "CMPI headers: the system's, in ${TVX_CMPI_INCLUDE_DIR}")
  tvx_forward_cmpi_headers("${TVX_CMPI_INCLUDE_DIR}")
elseif(TVX_SYSTEM_CMPI AND TVX_CMPI_INCLUDE_DIR)
  message(FATAL_ERROR "TVX_SYSTEM_CMPI is ON, but the CMPI headers in ${TVX_CMPI_INCLUDE_DIR} do not compile "
                      "or lack the names of version 2.1. Configure with TVX_SYSTEM_CMPI=OFF to use the "
                      "project's own.")
elseif(TVX_SYSTEM_CMPI)
  message(FATAL_ERROR "TVX_SYSTEM_CMPI is ON, but no cmpidt.h was found in the system's include folders or "
                      "their cmpi/ subfolder. Name its folder with TVX_CMPI_INCLUDE_DIR, or configure with "
                      "TVX_SYSTEM_CMPI=OFF to use the project's own.")
else()
  message(STATUS "CMPI headers: the project's own")
endif()
