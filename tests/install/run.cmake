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

# The one for C does in C, too.
run(log ${C_COMPILER} -std=c99 -fsyntax-only -Wall -Wextra -pedantic -Werror -I${sdk}/include -x c
    -include orbek/corbek.h /dev/null)

# The library shows nothing but its public names.
run(symbols nm -DC --defined-only ${lib}/liborbek.so)
string(REGEX MATCHALL "[^\n]+" symbols "${symbols}")
list(LENGTH symbols count)
set(functions ${symbols})
list(FILTER functions INCLUDE REGEX " T orbek[A-Z][A-Za-z]*$")
list(LENGTH functions function_count)
list(FILTER symbols EXCLUDE REGEX " Orbek::| (vtable|typeinfo|typeinfo name) for Orbek::| T orbek[A-Z][A-Za-z]*$")
if(count LESS 50 OR symbols OR NOT function_count EQUAL 15)
    message(FATAL_ERROR "of ${count} visible symbols, ${function_count} of functions for C, these are not public: ${symbols}")
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

# Examples by find_package...
set(ENV{LD_LIBRARY_PATH} ${lib})
foreach(example find_faces people search_in_c)
    run(log ${CMAKE_COMMAND} -S ${SOURCE}/examples/${example} -B ${SCRATCH}/${example} -DCMAKE_PREFIX_PATH=${sdk}
        -DCMAKE_CXX_COMPILER=${COMPILER} -DCMAKE_C_COMPILER=${C_COMPILER})
    run(log ${CMAKE_COMMAND} --build ${SCRATCH}/${example})
endforeach()
run(output ${SCRATCH}/find_faces/find_faces ${configuration} ${picture})
check("${output}" "${expected}")
set(people ${SOURCE}/examples/images)
set(searched ${configuration} ${people}/alice1.jpg ${people}/bob1.jpg ${people}/alice2.jpg ${people}/carl1.jpg)
set(found "1 of them may be the person of [^\n]*alice1.jpg\n[^\n]*alice2.jpg is found: ")
run(output ${SCRATCH}/search_in_c/search_in_c ${searched})
check("${output}" "${found}")
foreach(person alice bob)
    run(output ${SCRATCH}/people/enrol_people ${configuration} ${SCRATCH}/${person}.fir
        ${people}/${person}1.jpg ${people}/${person}2.jpg)
    check("${output}" "written to [^\n]*${person}.fir\n")
endforeach()
run(output ${SCRATCH}/people/verify_people ${configuration} ${SCRATCH}/bob.fir ${people}/bob3.jpg)
check("${output}" "\nthe same person\n")
run(output ${SCRATCH}/people/verify_people ${configuration} ${SCRATCH}/bob.fir ${people}/alice3.jpg)
check("${output}" "\nnot the same person\n")
run(output ${SCRATCH}/people/identify_people ${configuration} ${people}/alice4.jpg ${SCRATCH}/bob.fir
    ${SCRATCH}/alice.fir)
check("${output}" "^1 matches\n[^\n]*alice.fir: ")

# ...and by pkg-config.
set(ENV{PKG_CONFIG_PATH} ${lib}/pkgconfig)
run(flags pkg-config --cflags --libs orbek)
separate_arguments(flags UNIX_COMMAND "${flags}")
run(log ${COMPILER} -std=c++20 ${SOURCE}/examples/find_faces/find_faces.cpp -o ${SCRATCH}/find_faces_again ${flags})
run(output ${SCRATCH}/find_faces_again ${configuration} ${picture})
check("${output}" "${expected}")
run(log ${C_COMPILER} -std=c99 ${SOURCE}/examples/search_in_c/search.c -o ${SCRATCH}/search ${flags})
run(output ${SCRATCH}/search ${searched})
check("${output}" "${found}")

# The program finds its configuration by itself.
run(output ${sdk}/bin/orbek find --json ${picture})
check("${output}" "${expected_json}")
run(output ${sdk}/bin/orbek models check)
check("${output}" "bad 0")
if(NOT EXISTS ${sdk}/share/man/man1/orbek-enrol.1)
    message(FATAL_ERROR "the manual pages are not installed")
endif()
