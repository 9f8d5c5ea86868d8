# Fails when a source file includes a header of a layer above its own, or when one of the top
# layers includes another: the console (app) and the headless report (report) are programs built
# on the same layers, and neither may depend on the other. Run by the layer_check target on every
# build: -DSOURCE_DIR=<source tree>.
set(layers framework locale inventory settings)
set(top_layers app report)

# The rank of a layer: its place from the bottom; every top layer shares the highest rank. -1 for
# a folder that is no layer.
function(layer_rank layer out)
  list(FIND layers ${layer} rank)
  list(FIND top_layers ${layer} top)
  if(top GREATER -1)
    list(LENGTH layers rank)
  endif()
  set(${out} ${rank} PARENT_SCOPE)
endfunction()

set(violations "")
foreach(layer IN LISTS layers top_layers)
  layer_rank(${layer} rank)
  file(GLOB_RECURSE sources ${SOURCE_DIR}/${layer}/*.h ${SOURCE_DIR}/${layer}/*.cpp)
  foreach(source IN LISTS sources)
    file(STRINGS ${source} includes REGEX "^[ \t]*#[ \t]*include[ \t]*\"[a-z]+/")
    foreach(line IN LISTS includes)
      string(REGEX REPLACE "^[^\"]*\"([a-z]+)/.*$" "\\1" included "${line}")
      layer_rank(${included} includedRank)
      if(includedRank GREATER rank OR (includedRank EQUAL rank AND NOT included STREQUAL layer))
        file(RELATIVE_PATH name ${SOURCE_DIR} ${source})
        string(APPEND violations "\n  ${name}: ${line}")
      endif()
    endforeach()
  endforeach()
endforeach()

if(violations)
  list(JOIN layers " < " order)
  list(JOIN top_layers ", " tops)
  message(FATAL_ERROR "A layer includes a layer above it or another top layer (${order} < ${tops}):${violations}")
endif()
