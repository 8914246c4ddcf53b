# The processor levels, in slot order. These two tables drive the seven
# builds of every variant source, the stub tables, the level selection of
# the runtime and the level names and feature words that the tests, the
# benchmarks and the demo use. Features are named as in zortypes.h without
# the zorFeature prefix; the generated header turns them into words.
#
#   name | compiler flags | features its code needs (processor and system)
set(ZOR_LEVEL_ROWS
  "m7|-msse3|MMX SSE SSE2 SSE3"
  "n8|-mssse3 -mtune=silvermont|MMX SSE SSE2 SSE3 SSSE3"
  "y8|-msse4.2 -mpopcnt|MMX SSE SSE2 SSE3 SSSE3 SSE41 SSE42"
  "e9|-mavx|MMX SSE SSE2 SSE3 SSSE3 SSE41 SSE42 AVX AVXState"
  "l9|-mavx2 -mfma -mbmi -mbmi2|MMX SSE SSE2 SSE3 SSSE3 SSE41 SSE42 AVX AVXState AVX2"
  "n0|-mavx2 -mfma -mbmi -mbmi2 -mavx512f -mavx512cd|MMX SSE SSE2 SSE3 SSSE3 SSE41 SSE42 AVX AVXState AVX2 AVX512F AVX512CD AVX512State"
  "k0|-mavx2 -mfma -mbmi -mbmi2 -mavx512f -mavx512cd -mavx512bw -mavx512dq -mavx512vl|MMX SSE SSE2 SSE3 SSSE3 SSE41 SSE42 AVX AVXState AVX2 AVX512F AVX512CD AVX512BW AVX512DQ AVX512VL AVX512State"
)

# Selection from a feature word: the first row whose test features are all
# in the word gives the level, and its required word (everything that
# level relies on) is ORed into the word. A level's first row is also the
# word that selects it without complaint (zorSetCpuFeatures status 0).
#
#   level | test features | required word
set(ZOR_SELECT_ROWS
  "k0|AVX512F AVX512CD AVX512BW AVX512DQ AVX512VL|MMX SSE SSE2 SSE3 SSSE3 SSE41 SSE42 AVX AVX2 AVX512F AVX512CD AVX512BW AVX512DQ AVX512VL"
  "n0|AVX512F AVX512CD AVX512ER AVX512PF|MMX SSE SSE2 SSE3 SSSE3 SSE41 SSE42 AVX AVX2 AVX512F AVX512CD AVX512ER AVX512PF"
  "l9|AVX2|MMX SSE SSE2 SSE3 SSSE3 SSE41 SSE42 AVX AVX2"
  "e9|AVX|MMX SSE SSE2 SSE3 SSSE3 SSE41 SSE42 AVX"
  "y8|SSE42|MMX SSE SSE2 SSE3 SSSE3 SSE41 SSE42"
  "n8|SSE41|MMX SSE SSE2 SSE3 SSSE3 SSE41"
  "n8|MOVBE|MMX SSE SSE2 SSE3 SSSE3 MOVBE"
  "n8|SSSE3|MMX SSE SSE2 SSE3 SSSE3"
  "m7|SSE3|MMX SSE SSE2 SSE3"
  "m7|SSE2|MMX SSE SSE2"
)

# "MMX SSE" -> "(zorFeatureMMX|zorFeatureSSE)"
function(zor_feature_word out names)
  string(REGEX REPLACE "[ ]+" ";" names "${names}")
  list(TRANSFORM names PREPEND "zorFeature")
  list(JOIN names "|" word)
  set(${out} "(${word})" PARENT_SCOPE)
endfunction()

set(ZOR_LEVELS "")
set(_index 0)
foreach(_row IN LISTS ZOR_LEVEL_ROWS)
  string(REPLACE "|" ";" _f "${_row}")
  list(GET _f 0 _name)
  list(GET _f 1 _flags)
  list(GET _f 2 _need)
  string(REPLACE " " ";" _flags "${_flags}")
  set(ZOR_LEVEL_FLAGS_${_name} ${_flags})
  list(APPEND ZOR_LEVELS ${_name})
  set(ZOR_LEVEL_INDEX_${_name} ${_index})
  zor_feature_word(ZOR_LEVEL_NEED_${_name} "${_need}")
  math(EXPR _index "${_index} + 1")
endforeach()

set(ZOR_SELECT_LIST "")
foreach(_row IN LISTS ZOR_SELECT_ROWS)
  string(REPLACE "|" ";" _f "${_row}")
  list(GET _f 0 _name)
  list(GET _f 1 _test)
  list(GET _f 2 _required)
  if(NOT DEFINED ZOR_LEVEL_INDEX_${_name})
    message(FATAL_ERROR "selection row for unknown level ${_name}")
  endif()
  zor_feature_word(_test "${_test}")
  zor_feature_word(_required "${_required}")
  string(APPEND ZOR_SELECT_LIST " X(${_test}, ${ZOR_LEVEL_INDEX_${_name}}, ${_required})")
  if(NOT DEFINED ZOR_LEVEL_SELECT_${_name})
    set(ZOR_LEVEL_SELECT_${_name} "${_required}")
  endif()
endforeach()
foreach(_name IN LISTS ZOR_LEVELS)
  if(NOT DEFINED ZOR_LEVEL_SELECT_${_name})
    message(FATAL_ERROR "level ${_name} has no selection row")
  endif()
endforeach()
