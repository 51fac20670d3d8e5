# Installs the build tree into a fresh prefix, builds the consumer against it
# out of tree, and checks the point count it prints for a small file.
# -D: BUILD_DIR, SOURCE_DIR, WORK_DIR, CXX, FLAGS (the build's sanitizer flags).
file(REMOVE_RECURSE ${WORK_DIR})
set(prefix ${WORK_DIR}/prefix)

function(run)
  execute_process(COMMAND ${ARGV} RESULT_VARIABLE status OUTPUT_VARIABLE out ERROR_VARIABLE out)
  if(NOT status EQUAL 0)
    message(FATAL_ERROR "${ARGV}\n${out}")
  endif()
  set(out "${out}" PARENT_SCOPE)
endfunction()

run(${CMAKE_COMMAND} --install ${BUILD_DIR} --prefix ${prefix})
foreach(file lib/cmake/ZonCloud/ZonCloudConfig.cmake lib/cmake/ZonCloud/ZonCloudConfigVersion.cmake
             include/ZonCloud/ZonICloudReadFile.h include/ZonCloud/ZonCldBody.h bin/zoncloud)
  if(NOT EXISTS ${prefix}/${file})
    message(FATAL_ERROR "not installed: ${file}")
  endif()
endforeach()

run(${CMAKE_COMMAND} -S ${SOURCE_DIR} -B ${WORK_DIR}/build -DCMAKE_PREFIX_PATH=${prefix}
    -DCMAKE_CXX_COMPILER=${CXX} "-DCMAKE_CXX_FLAGS=${FLAGS}" "-DCMAKE_EXE_LINKER_FLAGS=${FLAGS}")
run(${CMAKE_COMMAND} --build ${WORK_DIR}/build)

file(WRITE ${WORK_DIR}/three.asc "1 2 3\n4 5 6\n7 8 9\n")
run(${WORK_DIR}/build/count_points ${WORK_DIR}/three.asc)
if(NOT out STREQUAL "3\n")
  message(FATAL_ERROR "the consumer printed \"${out}\", not 3")
endif()
# The installed tool runs from its prefix.
run(${prefix}/bin/zoncloud --version)
message(STATUS "consumer: 3 points; ${out}")
