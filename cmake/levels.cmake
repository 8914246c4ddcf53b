# The processor levels, in slot order. This one table drives the seven
# builds of every variant source, the stub tables and the level names and
# feature words that the tests and the demo use.
#
#   name  compiler flags                       word that selects it   bits its code needs
#                                                (zorSetCpuFeatures)    (incl. OS state bits)
set(ZOR_LEVEL_ROWS
  "m7|-msse3|0xf|0xf"
  "n8|-mssse3,-mtune=silvermont|0x3f|0x3f"
  "y8|-msse4.2,-mpopcnt|0xdf|0xdf"
  "e9|-mavx|0x1df|0x3df"
  "l9|-mavx2,-mfma,-mbmi,-mbmi2|0x81df|0x83df"
  "n0|-mavx2,-mfma,-mbmi,-mbmi2,-mavx512f,-mavx512cd|0xf081df|0x2003083df"
  "k0|-mavx2,-mfma,-mbmi,-mbmi2,-mavx512f,-mavx512cd,-mavx512bw,-mavx512dq,-mavx512vl|0x73081df|0x2073083df"
)

set(ZOR_LEVELS "")
set(_index 0)
foreach(_row IN LISTS ZOR_LEVEL_ROWS)
  string(REPLACE "|" ";" _f "${_row}")
  list(GET _f 0 _name)
  list(GET _f 1 _flags)
  list(GET _f 2 _select)
  list(GET _f 3 _need)
  string(REPLACE "," ";" _flags "${_flags}")
  set(ZOR_LEVEL_FLAGS_${_name} ${_flags})
  list(APPEND ZOR_LEVELS ${_name})
  set(ZOR_LEVEL_INDEX_${_name} ${_index})
  set(ZOR_LEVEL_SELECT_${_name} ${_select})
  set(ZOR_LEVEL_NEED_${_name} ${_need})
  math(EXPR _index "${_index} + 1")
endforeach()
