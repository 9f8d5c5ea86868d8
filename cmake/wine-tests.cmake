# Every test runs in one Wine prefix that the run creates afresh (fixture "wine") and a
# persistent wineserver that it stops at the end.
add_test(NAME wine.session.start
         COMMAND ${CMAKE_SOURCE_DIR}/tools/wine-session.sh start ${CMAKE_BINARY_DIR})
add_test(NAME wine.session.stop
         COMMAND ${CMAKE_SOURCE_DIR}/tools/wine-session.sh stop ${CMAKE_BINARY_DIR})
set_tests_properties(wine.session.start PROPERTIES FIXTURES_SETUP wine TIMEOUT 300)
set_tests_properties(wine.session.stop PROPERTIES FIXTURES_CLEANUP wine)

# add_wine_unit_test(NAME n COMMAND target [args...] [LANG ll_CC] [ENV VAR=value...])
# For a test that leaves the prefix's registry and shared folders alone (plain rules, or
# in-process registry work under testing_support::ScopedHiveOverride): it may run in parallel
# with any other test. LANG makes that process's Windows user locale and UI language the given one.
function(add_wine_unit_test)
  cmake_parse_arguments(T "" "NAME;LANG" "COMMAND;ENV" ${ARGN})
  add_test(NAME ${T_NAME} COMMAND ${T_COMMAND})
  set(env "")
  if(T_LANG)
    list(APPEND env "LC_ALL=${T_LANG}.UTF-8")
  else()
    list(APPEND env "LC_ALL=en_US.UTF-8")
  endif()
  list(APPEND env ${T_ENV})
  set_tests_properties(${T_NAME} PROPERTIES FIXTURES_REQUIRED wine ENVIRONMENT "${env}" TIMEOUT 300)
endfunction()

# add_wine_test: the same, for a test that needs the prefix's real registry hives or shared
# folders (COM registration, child processes, copied programs, the suite's common folder). Such
# tests take turns (resource lock) and each one restores what it changes.
function(add_wine_test)
  add_wine_unit_test(${ARGN})
  cmake_parse_arguments(T "" "NAME;LANG" "COMMAND;ENV" ${ARGN})
  set_tests_properties(${T_NAME} PROPERTIES RESOURCE_LOCK wineprefix)
endfunction()
