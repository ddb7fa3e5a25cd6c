# Runs PROGRAM ARGUMENT and writes its standard output to OUTPUT; a failure fails the build.
# EMULATOR, when cross-compiling, is what runs a program built for the target (qemu-user).
execute_process(COMMAND ${EMULATOR} ${PROGRAM} ${ARGUMENT} OUTPUT_FILE ${OUTPUT}.part
                RESULT_VARIABLE result)
if(NOT result EQUAL 0)
  file(REMOVE ${OUTPUT}.part)
  message(FATAL_ERROR "${PROGRAM} ${ARGUMENT} failed: ${result}")
endif()
file(RENAME ${OUTPUT}.part ${OUTPUT})
