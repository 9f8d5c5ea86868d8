# Builds one Windows Installer package from a staging folder:
#
#   cmake -DSTAGING_DIR=<folder> -DARCH=x86|x64 -DVERSION=MAJOR.MINOR.BUILD -DOUTPUT=<file.msi>
#         [-DWIXL=<path>] -P installer/BuildPackage.cmake
#
# The staging folder holds exactly what goes into the package (installer/CMakeLists.txt fills it):
#   bin/MaporaAdmin.exe  bin/MaporaReport.exe  packs/<tag>/ResMaporaAdmin.dll
#   policy/Mapora.admx  policy/<locale>/Mapora.adml  MaporaAdmin.ico
# This step only reads it, so anything that has to change the files before they are packaged
# (signing the programs and packs) rewrites them there first; anything that has to change the
# package itself (signing the .msi) takes OUTPUT afterwards. The tests call it too, with other
# versions, to build the packages they upgrade from.
cmake_minimum_required(VERSION 3.21)

foreach(var STAGING_DIR ARCH VERSION OUTPUT)
  if(NOT DEFINED ${var} OR "${${var}}" STREQUAL "")
    message(FATAL_ERROR "BuildPackage.cmake: -D${var}=... is required")
  endif()
endforeach()
if(NOT ARCH MATCHES "^(x86|x64)$")
  message(FATAL_ERROR "BuildPackage.cmake: ARCH is ${ARCH}; expected x86 or x64")
endif()
# Windows Installer compares the first three fields, each within these limits.
if(NOT VERSION MATCHES "^([0-9]+)\\.([0-9]+)\\.([0-9]+)$" OR CMAKE_MATCH_1 GREATER 255 OR CMAKE_MATCH_2 GREATER 255
   OR CMAKE_MATCH_3 GREATER 65535)
  message(FATAL_ERROR "BuildPackage.cmake: VERSION is ${VERSION}; expected MAJOR.MINOR.BUILD (255.255.65535 at most)")
endif()
if(NOT WIXL)
  find_program(WIXL wixl)
  if(NOT WIXL)
    message(FATAL_ERROR "wixl (package wixl) was not found; tools/install-deps.sh installs it")
  endif()
endif()

# The ProductCode follows from the version and the architecture: rebuilding a version gives the
# package the same code (a detection rule keeps matching it), a new version gets a new one (a
# major upgrade). The namespace is the package's UpgradeCode.
string(UUID product_code NAMESPACE 3288AE03-25AF-4446-81DF-B109D5A71856 NAME "MaporaAdmin ${ARCH} ${VERSION}"
       TYPE SHA1 UPPER)

get_filename_component(wxs "${CMAKE_CURRENT_LIST_DIR}/MaporaAdmin.wxs" ABSOLUTE)
get_filename_component(OUTPUT "${OUTPUT}" ABSOLUTE)
get_filename_component(output_dir "${OUTPUT}" DIRECTORY)
file(MAKE_DIRECTORY "${output_dir}")
execute_process(
  COMMAND ${WIXL} -a ${ARCH} -D Arch=${ARCH} -D Version=${VERSION} -D ProductCode=${product_code}
          -D StagingDir=. -o ${OUTPUT}.tmp ${wxs}
  # wixl takes only relative source paths, from the current folder.
  WORKING_DIRECTORY ${STAGING_DIR}
  RESULT_VARIABLE result)
if(NOT result EQUAL 0)
  file(REMOVE "${OUTPUT}.tmp")
  message(FATAL_ERROR "wixl failed (${result}) building ${OUTPUT}")
endif()
file(RENAME "${OUTPUT}.tmp" "${OUTPUT}")
