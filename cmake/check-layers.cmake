# Fails when a source file includes a header of a layer above its own. Run by the layer_check
# target on every build: -DSOURCE_DIR=<source tree>.
set(layers framework locale inventory settings app)

set(violations "")
foreach(layer IN LISTS layers)
  list(FIND layers ${layer} rank)
  file(GLOB_RECURSE sources ${SOURCE_DIR}/${layer}/*.h ${SOURCE_DIR}/${layer}/*.cpp)
  foreach(source IN LISTS sources)
    file(STRINGS ${source} includes REGEX "^[ \t]*#[ \t]*include[ \t]*\"[a-z]+/")
    foreach(line IN LISTS includes)
      string(REGEX REPLACE "^[^\"]*\"([a-z]+)/.*$" "\\1" included "${line}")
      list(FIND layers ${included} includedRank)
      if(includedRank GREATER rank)
        file(RELATIVE_PATH name ${SOURCE_DIR} ${source})
        string(APPEND violations "\n  ${name}: ${line}")
      endif()
    endforeach()
  endforeach()
endforeach()

if(violations)
  message(FATAL_ERROR "A layer includes a layer above it (${layers}):${violations}")
endif()
