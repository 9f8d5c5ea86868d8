# A resource-only library: no code and no entry point, loaded for its resources alone.
function(add_resource_library target rc_file)
  add_library(${target} SHARED ${rc_file})
  set_target_properties(${target} PROPERTIES PREFIX "" LINKER_LANGUAGE C)
  target_link_options(${target} PRIVATE -nostdlib -Wl,-e,0 -Wl,--no-insert-timestamp)
endfunction()
