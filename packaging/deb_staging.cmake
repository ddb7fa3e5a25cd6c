# Runs inside cpack on the staged tree, before the package is made: what a Debian package needs
# beyond "cmake --install" - the copyright file and a changelog in the documentation folder,
# lintian's notes on the metafile renderers, and the manual pages compressed (gzip -9n, so the
# package does not change with the time it is built).
find_program(GZIP gzip REQUIRED)
file(GLOB_RECURSE staged_docs LIST_DIRECTORIES true "${CPACK_TEMPORARY_DIRECTORY}/*/share/doc/quillane")
if(NOT staged_docs)
  message(FATAL_ERROR "no share/doc/quillane under ${CPACK_TEMPORARY_DIRECTORY}")
endif()
foreach(doc IN LISTS staged_docs)
  if(NOT IS_DIRECTORY "${doc}")
    continue()
  endif()
  get_filename_component(share "${doc}/../.." ABSOLUTE)
  file(COPY "${CPACK_QUILLANE_PACKAGING_DIR}/copyright" DESTINATION "${doc}"
       FILE_PERMISSIONS OWNER_READ OWNER_WRITE GROUP_READ WORLD_READ)
  configure_file("${CPACK_QUILLANE_PACKAGING_DIR}/changelog.in" "${doc}/changelog" @ONLY)
  configure_file("${CPACK_QUILLANE_PACKAGING_DIR}/lintian-overrides"
                 "${share}/lintian/overrides/quillane" COPYONLY)
  set(to_compress "${doc}/changelog")
  file(GLOB pages "${share}/man/man*/*.[0-9]")
  list(APPEND to_compress ${pages})
  foreach(file IN LISTS to_compress)
    execute_process(COMMAND "${GZIP}" -9nf "${file}" RESULT_VARIABLE failed)
    if(failed)
      message(FATAL_ERROR "gzip ${file} failed")
    endif()
  endforeach()
endforeach()
