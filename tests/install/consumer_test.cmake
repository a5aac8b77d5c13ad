# Driven by ctest: install, then build and run the consumer both ways, and the
# installed tool.
file(REMOVE_RECURSE ${WORK_DIR})
set(prefix ${WORK_DIR}/prefix)
function(run)
  execute_process(COMMAND ${ARGN} RESULT_VARIABLE rc OUTPUT_VARIABLE out ERROR_VARIABLE err)
  if(NOT rc EQUAL 0)
    message(FATAL_ERROR "failed: ${ARGN}\n${out}\n${err}")
  endif()
  set(last_output "${out}" PARENT_SCOPE)
endfunction()

run(${CMAKE_COMMAND} --install ${BUILD_DIR} --prefix ${prefix})
file(GLOB libdirs ${prefix}/lib*)
set(found_pc "")
foreach(d ${libdirs})
  file(GLOB_RECURSE pc ${d}/pkgconfig/lodestack.pc)
  if(pc)
    set(found_pc ${pc})
    get_filename_component(libdir ${d} ABSOLUTE)
  endif()
endforeach()
if(NOT found_pc)
  message(FATAL_ERROR "lodestack.pc was not installed")
endif()
get_filename_component(pcdir ${found_pc} DIRECTORY)
get_filename_component(libdir ${pcdir} DIRECTORY)
if(NOT EXISTS ${libdir}/liblodestack.so.1 OR NOT EXISTS ${libdir}/liblodestack.so)
  message(FATAL_ERROR "library symlinks missing in ${libdir}")
endif()

set(extra "")
if(SANITIZE)
  set(extra -fsanitize=${SANITIZE})
endif()

# 1. pkg-config
set(ENV{PKG_CONFIG_PATH} ${pcdir})
execute_process(COMMAND pkg-config --cflags --libs lodestack
  OUTPUT_VARIABLE flags OUTPUT_STRIP_TRAILING_WHITESPACE RESULT_VARIABLE rc)
if(NOT rc EQUAL 0)
  message(FATAL_ERROR "pkg-config does not know lodestack")
endif()
separate_arguments(flags UNIX_COMMAND "${flags}")
run(${CXX} -std=c++17 ${extra} ${SOURCE_DIR}/consumer/main.cpp ${flags}
    -o ${WORK_DIR}/consumer_pkgconfig)
set(ENV{LD_LIBRARY_PATH} ${libdir})
run(${WORK_DIR}/consumer_pkgconfig)
if(NOT last_output MATCHES "consumer ok")
  message(FATAL_ERROR "pkg-config consumer printed: ${last_output}")
endif()

# 2. find_package
run(${CMAKE_COMMAND} -S ${SOURCE_DIR}/consumer -B ${WORK_DIR}/cmake-build
    -DCMAKE_PREFIX_PATH=${prefix} -DCMAKE_CXX_COMPILER=${CXX}
    "-DCMAKE_CXX_FLAGS=${extra}")
run(${CMAKE_COMMAND} --build ${WORK_DIR}/cmake-build)
run(${WORK_DIR}/cmake-build/consumer)
if(NOT last_output MATCHES "consumer ok")
  message(FATAL_ERROR "find_package consumer printed: ${last_output}")
endif()

# 3. The installed tool finds the installed library by its own RPATH.
if(EXISTS ${prefix}/bin/lodestack-scan)
  unset(ENV{LD_LIBRARY_PATH})
  run(${prefix}/bin/lodestack-scan --version)
  if(NOT last_output MATCHES "^lodestack-scan ")
    message(FATAL_ERROR "installed lodestack-scan printed: ${last_output}")
  endif()
endif()
