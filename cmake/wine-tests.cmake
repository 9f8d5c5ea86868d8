# Every test runs in one Wine prefix that the run creates afresh (fixture "wine") and a
# persistent wineserver that it stops at the end. The prefix's registry and file system are
# shared, so the tests take turns (resource lock) and each one restores what it changes.
add_test(NAME wine.session.start
         COMMAND ${CMAKE_SOURCE_DIR}/tools/wine-session.sh start ${CMAKE_BINARY_DIR})
add_test(NAME wine.session.stop
         COMMAND ${CMAKE_SOURCE_DIR}/tools/wine-session.sh stop ${CMAKE_BINARY_DIR})
set_tests_properties(wine.session.start PROPERTIES FIXTURES_SETUP wine TIMEOUT 300)
set_tests_properties(wine.session.stop PROPERTIES FIXTURES_CLEANUP wine)

# add_wine_test(NAME n COMMAND target [args...] [LANG ll_CC] [ENV VAR=value...])
# LANG makes that process's Windows user locale and UI language the given one.
function(add_wine_test)
  cmake_parse_arguments(T "" "NAME;LANG" "COMMAND;ENV" ${ARGN})
  add_test(NAME ${T_NAME} COMMAND ${T_COMMAND})
  set(env "")
  if(T_LANG)
    list(APPEND env "LC_ALL=${T_LANG}.UTF-8")
  else()
    list(APPEND env "LC_ALL=en_US.UTF-8")
  endif()
  list(APPEND env ${T_ENV})
  set_tests_properties(${T_NAME} PROPERTIES
    FIXTURES_REQUIRED wine RESOURCE_LOCK wineprefix ENVIRONMENT "${env}" TIMEOUT 300)
endfunction()
