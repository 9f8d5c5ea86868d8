# Authenticode signing of what ships, switched on by the release's certificate: a PKCS#12 file
# named by MAPORA_SIGN_PKCS12 (environment or cache), kept outside the source tree. Its password is
# read from MAPORA_SIGN_PASSWORD by tools/sign.sh when the build signs, never by CMake, so that it
# is neither cached nor written into a build rule. MAPORA_SIGN_TIMESTAMP_URL names an RFC 3161
# time-stamping server.
set(MAPORA_SIGN_SCRIPT ${CMAKE_SOURCE_DIR}/tools/sign.sh)
# The name Windows shows for a signed file, for example in the elevation prompt of a package.
set(MAPORA_SIGN_DESCRIPTION "Mapora Administrator")

# Taken from the environment at each configure and not cached, so that a tree once configured for a
# release does not go on signing when configured again without the certificate.
if(DEFINED ENV{MAPORA_SIGN_PKCS12})
  set(MAPORA_SIGN_PKCS12 "$ENV{MAPORA_SIGN_PKCS12}")
endif()
if(DEFINED ENV{MAPORA_SIGN_TIMESTAMP_URL})
  set(MAPORA_SIGN_TIMESTAMP_URL "$ENV{MAPORA_SIGN_TIMESTAMP_URL}")
endif()

if(MAPORA_SIGN_PKCS12)
  get_filename_component(MAPORA_SIGN_PKCS12 "${MAPORA_SIGN_PKCS12}" ABSOLUTE)
  if(NOT EXISTS "${MAPORA_SIGN_PKCS12}")
    message(FATAL_ERROR "MAPORA_SIGN_PKCS12 names ${MAPORA_SIGN_PKCS12}, which does not exist")
  endif()
  find_program(MAPORA_OSSLSIGNCODE osslsigncode)
  if(NOT MAPORA_OSSLSIGNCODE)
    message(FATAL_ERROR "Signing needs osslsigncode (tools/install-deps.sh installs it)")
  endif()
  set(MAPORA_SIGNING ON)
  if(MAPORA_SIGN_TIMESTAMP_URL)
    set(stamps "timestamps from ${MAPORA_SIGN_TIMESTAMP_URL}")
  else()
    set(stamps "no time-stamping server (MAPORA_SIGN_TIMESTAMP_URL), so no timestamps")
  endif()
  message(STATUS "Signing: on, with the certificate in ${MAPORA_SIGN_PKCS12}; ${stamps}")
else()
  set(MAPORA_SIGNING OFF)
  message(STATUS "Signing: off (MAPORA_SIGN_PKCS12 is not set): the build signs nothing")
endif()

# mapora_sign_files(<target> [TARGETS <targets>...] [FILES <files>...] [DEPENDS <targets>...])
# A target, built by default, that signs in place the outputs of TARGETS and the FILES that the
# DEPENDS targets make (the packages). A command that takes these files to ship them depends on
# <target> and on the file <target>_STAMP names (touched once they are signed, empty without a
# certificate), so it takes them signed. Without a certificate the target does nothing.
function(mapora_sign_files name)
  cmake_parse_arguments(S "" "" "TARGETS;FILES;DEPENDS" ${ARGN})
  set(${name}_STAMP "" PARENT_SCOPE)
  if(NOT MAPORA_SIGNING)
    add_custom_target(${name})
    if(S_TARGETS OR S_DEPENDS)
      add_dependencies(${name} ${S_TARGETS} ${S_DEPENDS})
    endif()
    return()
  endif()
  set(files ${S_FILES})
  foreach(t ${S_TARGETS})
    list(APPEND files $<TARGET_FILE:${t}>)
  endforeach()
  set(args --pkcs12 ${MAPORA_SIGN_PKCS12} --description ${MAPORA_SIGN_DESCRIPTION})
  if(MAPORA_SIGN_TIMESTAMP_URL)
    list(APPEND args --timestamp ${MAPORA_SIGN_TIMESTAMP_URL})
  endif()
  # The stamp is touched after the files, so a build that changed none of them signs nothing; one
  # that relinked some re-runs the script, which leaves the files it signed before alone.
  set(stamp ${CMAKE_CURRENT_BINARY_DIR}/${name}.signed)
  add_custom_command(OUTPUT ${stamp}
    COMMAND ${MAPORA_SIGN_SCRIPT} ${args} ${files}
    COMMAND ${CMAKE_COMMAND} -E touch ${stamp}
    DEPENDS ${S_TARGETS} ${S_DEPENDS} ${S_FILES} ${MAPORA_SIGN_SCRIPT} ${MAPORA_SIGN_PKCS12}
    COMMENT "Signing ${name}"
    VERBATIM)
  add_custom_target(${name} ALL DEPENDS ${stamp})
  set(${name}_STAMP ${stamp} PARENT_SCOPE)
endfunction()
