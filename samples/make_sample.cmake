# Builds one sample database from its readable sources:
#   cmake -DCLI=... -DSRC=<dir> -DOUT=<dir> -DNAME=<Name> -P make_sample.cmake
# NAME.fields holds the field descriptions, NAME.csv the records (UTF-8,
# which import-csv reads by default).
cmake_minimum_required(VERSION 3.25)

set(locale --date-format M/d/yyyy --time-format "h:mm:ss tt" --decimal .)
set(db ${OUT}/${NAME}.PDB)

function(run)
  execute_process(COMMAND ${CLI} ${locale} ${ARGN} RESULT_VARIABLE rc OUTPUT_QUIET
                  ERROR_VARIABLE err)
  if(NOT rc EQUAL 0)
    message(FATAL_ERROR "cardovex-cli ${ARGN} failed (${rc}): ${err}")
  endif()
endfunction()

file(STRINGS ${SRC}/${NAME}.fields lines ENCODING UTF-8)
set(fields)
foreach(line IN LISTS lines)
  if(line MATCHES "^#" OR line STREQUAL "")
    continue()
  endif()
  list(APPEND fields --field "${line}")
endforeach()
run(new ${db} --force --name ${NAME} ${fields})
# A new database gives every slot a column width, unused ones too; the
# samples show only the fields they use.
set(used 0)
foreach(line IN LISTS lines)
  if(NOT (line MATCHES "^#" OR line STREQUAL ""))
    math(EXPR used "${used} + 1")
  endif()
endforeach()
if(used LESS 30)
  foreach(slot RANGE ${used} 29)
    run(set-field ${db} ${slot} --pixels 0)
  endforeach()
endif()

run(import-csv ${db} ${SRC}/${NAME}.csv)
run(recalc ${db})

if(NAME STREQUAL "Vault")
  # The vault asks for its password to be opened and to change its design.
  run(security ${db} --set-password secret)
  run(--password secret security ${db} "Open Database" "Password Required")
  run(--password secret security ${db} "DB Properties" "Password Required")
  run(--password secret security ${db} "Edit Records" "View Records Only")
endif()
