# Compares what the library exports with what its headers declare: the two must be the same names.
#   cmake -DNM=<nm> -DLIBRARY=<shared library> -DHEADERS=<directory> -P exports.cmake

execute_process(COMMAND ${NM} -D --defined-only --format=posix ${LIBRARY}
                OUTPUT_VARIABLE symbols COMMAND_ERROR_IS_FATAL ANY)
string(REGEX MATCHALL "[^\n]+" symbols "${symbols}")
list(TRANSFORM symbols REPLACE " .*" "" OUTPUT_VARIABLE exported)

file(GLOB headers ${HEADERS}/*.h)
set(declared)
foreach(header IN LISTS headers)
  file(STRINGS ${header} prototypes REGEX "^[A-Za-z].*[ *]dsp[a-z0-9_]+\\(")
  list(TRANSFORM prototypes REPLACE "^.*[ *](dsp[a-z0-9_]+)\\(.*" "\\1")
  list(APPEND declared ${prototypes})
endforeach()

list(LENGTH declared count)
if(count EQUAL 0)
  message(SEND_ERROR "no declarations in ${HEADERS}")
endif()
set(missing ${declared})
list(REMOVE_ITEM missing ${exported})
if(missing)
  list(JOIN missing "\n  " missing)
  message(SEND_ERROR "declared but not exported:\n  ${missing}")
endif()
list(REMOVE_ITEM exported ${declared})
if(exported)
  list(JOIN exported "\n  " exported)
  message(SEND_ERROR "exported but not declared:\n  ${exported}")
endif()
