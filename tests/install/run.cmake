# Run by CTest: installs the build, and works with the installed tree as somebody else's product would.
cmake_minimum_required(VERSION 3.25)

set(sdk ${SCRATCH}/sdk)
set(lib ${sdk}/${LIBDIR})
set(configuration ${sdk}/share/orbek/orbek.conf)
file(REMOVE_RECURSE ${SCRATCH})
file(MAKE_DIRECTORY ${SCRATCH})

# run(<variable> <command>...): the output of a command that must succeed.
function(run variable)
    execute_process(COMMAND ${ARGN} OUTPUT_VARIABLE output ERROR_VARIABLE error RESULT_VARIABLE status)
    if(NOT status EQUAL 0)
        message(FATAL_ERROR "${ARGN}: ${status}\n${output}${error}")
    endif()
    set(${variable} "${output}" PARENT_SCOPE)
endfunction()

run(log ${CMAKE_COMMAND} --install ${BUILD} --prefix ${sdk})

# Each public header stands alone.
file(GLOB headers RELATIVE ${sdk}/include ${sdk}/include/orbek/*.h)
list(LENGTH headers count)
if(count LESS 10)
    message(FATAL_ERROR "only ${count} headers were installed")
endif()
foreach(header IN LISTS headers)
    run(log ${COMPILER} -std=c++20 -fsyntax-only -Wall -Wextra -Wpedantic -Werror -I${sdk}/include -x c++
        -include ${header} /dev/null)
endforeach()

# The library shows nothing but its public names.
run(symbols nm -DC --defined-only ${lib}/liborbek.so)
string(REGEX MATCHALL "[^\n]+" symbols "${symbols}")
list(LENGTH symbols count)
list(FILTER symbols EXCLUDE REGEX " Orbek::| (vtable|typeinfo|typeinfo name) for Orbek::")
if(count LESS 50 OR symbols)
    message(FATAL_ERROR "of ${count} visible symbols these are not public: ${symbols}")
endif()
run(dynamic readelf -d ${lib}/liborbek.so)
if(NOT dynamic MATCHES "SONAME[^\n]*\\[liborbek\\.so\\.${VERSION}\\]")
    message(FATAL_ERROR "no SONAME: ${dynamic}")
endif()

# A photo if there is one, otherwise a gray picture without a face.
set(picture ${SOURCE}/../shared/data/scenes/faces/celeba_001719.jpg)
set(expected "1 faces in 300 x 343 pixels")
set(expected_json "\"eye_distance\":")
if(NOT EXISTS ${picture})
    set(picture ${SCRATCH}/gray.pgm)
    string(REPEAT "A" 4096 pixels)
    file(WRITE ${picture} "P5\n64 64\n255\n${pixels}")
    set(expected "0 faces in 64 x 64 pixels")
    set(expected_json "\"faces\":\\[\\]")
endif()
function(check output wanted)
    if(NOT output MATCHES "${wanted}")
        message(FATAL_ERROR "expected ${wanted}, got: ${output}")
    endif()
endfunction()

# The example by find_package...
run(log ${CMAKE_COMMAND} -S ${SOURCE}/examples/find_faces -B ${SCRATCH}/example -DCMAKE_PREFIX_PATH=${sdk}
    -DCMAKE_CXX_COMPILER=${COMPILER})
run(log ${CMAKE_COMMAND} --build ${SCRATCH}/example)
run(output ${SCRATCH}/example/find_faces ${configuration} ${picture})
check("${output}" "${expected}")

# ...and by pkg-config.
set(ENV{PKG_CONFIG_PATH} ${lib}/pkgconfig)
run(flags pkg-config --cflags --libs orbek)
separate_arguments(flags UNIX_COMMAND "${flags}")
run(log ${COMPILER} -std=c++20 ${SOURCE}/examples/find_faces/find_faces.cpp -o ${SCRATCH}/find_faces ${flags})
set(ENV{LD_LIBRARY_PATH} ${lib})
run(output ${SCRATCH}/find_faces ${configuration} ${picture})
check("${output}" "${expected}")

# The program finds its configuration by itself.
run(output ${sdk}/bin/orbek find --json ${picture})
check("${output}" "${expected_json}")
run(output ${sdk}/bin/orbek models check)
check("${output}" "bad 0")
if(NOT EXISTS ${sdk}/share/man/man1/orbek-enrol.1)
    message(FATAL_ERROR "the manual pages are not installed")
endif()
