# Installs the build in BUILD into a folder of its own, builds the project CONSUMER against that, and runs its
# tests.
set(place ${BUILD}/installation_test)
file(REMOVE_RECURSE ${place})

function(run)
  execute_process(COMMAND ${ARGN} RESULT_VARIABLE status OUTPUT_VARIABLE output ERROR_VARIABLE output)
  if(NOT status EQUAL 0)
    message(FATAL_ERROR "${ARGN}: ${status}\n${output}")
  endif()
endfunction()

run(${CMAKE_COMMAND} --install ${BUILD} --component shared --prefix ${place}/installed)
run(${CMAKE_COMMAND} --install ${BUILD} --component library --prefix ${place}/installed)
run(${CMAKE_COMMAND} -G ${GENERATOR} -S ${CONSUMER} -B ${place}/consumer -DCMAKE_PREFIX_PATH=${place}/installed
  -DCMAKE_CXX_COMPILER=${COMPILER} -DCMAKE_CXX_FLAGS=${FLAGS})
run(${CMAKE_COMMAND} --build ${place}/consumer)
run(${CMAKE_CTEST_COMMAND} --test-dir ${place}/consumer --output-on-failure --no-tests=error)
