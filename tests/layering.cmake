# Fails when a lower folder includes a header of a higher one: the folder
# tree is the dependency graph, and the UI folders stand on the foundation.
# entry/errors is the error model every folder raises through: a target of
# its own below everything, only kept beside the entry it belongs to.
#   cmake -DROOT=<source folder> -P layering.cmake

set(lower krn log dunemere serverlibs sharedsource resources)
set(higher pages configdialog optimize entry)

set(violations "")
foreach(folder ${lower})
  file(GLOB_RECURSE sources "${ROOT}/${folder}/*.h" "${ROOT}/${folder}/*.cpp")
  foreach(source ${sources})
    file(STRINGS "${source}" includes REGEX "^[ \t]*#[ \t]*include[ \t]*\"")
    foreach(line ${includes})
      foreach(up ${higher})
        if(line MATCHES "\"${up}/" AND NOT line MATCHES "\"entry/errors/")
          file(RELATIVE_PATH shown "${ROOT}" "${source}")
          list(APPEND violations "${shown}: ${line}")
        endif()
      endforeach()
    endforeach()
  endforeach()
endforeach()

if(violations)
  list(JOIN violations "\n  " text)
  message(FATAL_ERROR "lower folders include higher ones:\n  ${text}")
endif()
