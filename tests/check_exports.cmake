# Compares the dynamic symbols a shared library defines with the names of the catalogue of
# exports (CATALOG, catalog/exports.h): every row's name, nothing more or less.
execute_process(COMMAND ${NM} -D --defined-only ${LIBRARY}
  OUTPUT_VARIABLE nm_out RESULT_VARIABLE nm_rc)
if(NOT nm_rc EQUAL 0)
  message(FATAL_ERROR "${NM} failed on ${LIBRARY}")
endif()

string(REPLACE "\n" ";" nm_lines "${nm_out}")
set(actual "")
foreach(line IN LISTS nm_lines)
  # "address type name"; the version node the linker adds for a versioned SONAME is type A.
  if(line MATCHES "^[0-9a-fA-F]+ ([A-Za-z]) (.+)$")
    set(type "${CMAKE_MATCH_1}")
    set(name "${CMAKE_MATCH_2}")
    # Sanitizer builds add ODR indicators and runtime hooks of their own.
    if(NOT type STREQUAL "A" AND NOT name MATCHES "^__(odr_asan|asan|ubsan|sanitizer|tsan)")
      list(APPEND actual "${name}")
    endif()
  endif()
endforeach()

# The rows of the table: row("name", ...), fn(...), table(...), global(...) and {"name", Shape::.
file(READ ${CATALOG} text)
string(REGEX MATCHALL "\n +(row|fn|table|global)\\(\"[A-Za-z0-9_]+\"|\n +{\"[A-Za-z0-9_]+\", Shape::"
       rows "${text}")
set(expected "")
foreach(row IN LISTS rows)
  string(REGEX REPLACE "^[^\"]*\"([A-Za-z0-9_]+)\".*$" "\\1" name "${row}")
  list(APPEND expected "${name}")
endforeach()

list(SORT actual)
list(SORT expected)
set(missing ${expected})
list(REMOVE_ITEM missing ${actual})
set(stray ${actual})
list(REMOVE_ITEM stray ${expected})
list(LENGTH expected n_expected)
list(LENGTH actual n_actual)
if(missing OR stray OR n_expected LESS 100)
  string(REPLACE ";" " " missing "${missing}")
  string(REPLACE ";" " " stray "${stray}")
  message(FATAL_ERROR "exports differ from the catalogue (${n_expected} rows)\n"
                      "  in the catalogue, not exported: ${missing}\n"
                      "  exported, not in the catalogue: ${stray}")
endif()
message(STATUS "exports match the catalogue: ${n_actual} symbols")
