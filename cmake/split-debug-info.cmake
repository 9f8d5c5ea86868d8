# Moves a program's debug information into <program>.debug beside it, which the program names
# (.gnu_debuglink) so that debuggers still find it. Under Wine the debug sections inside a program
# count in its working set (4.4 MB of the console's in the start-up benchmark, about as large as the
# whole difference from the floor), which Windows maps without reading; so the start-up benchmark's
# two programs carry theirs apart. A build without debug information is left alone.
function(mapora_split_debug_info target)
  if(NOT MINGW OR NOT CMAKE_OBJCOPY OR NOT CMAKE_BUILD_TYPE MATCHES "^(Debug|RelWithDebInfo)$")
    return()
  endif()
  set(program $<TARGET_FILE_NAME:${target}>)
  add_custom_command(TARGET ${target} POST_BUILD
    COMMAND ${CMAKE_OBJCOPY} --only-keep-debug ${program} ${program}.debug
    COMMAND ${CMAKE_OBJCOPY} --strip-debug --add-gnu-debuglink=${program}.debug ${program}
    WORKING_DIRECTORY $<TARGET_FILE_DIR:${target}>
    VERBATIM)
endfunction()
