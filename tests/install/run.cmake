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

# The tree works where it was moved to, and nothing in it remembers another place.
run(log ${CMAKE_COMMAND} --install ${BUILD} --prefix ${SCRATCH}/first)
file(RENAME ${SCRATCH}/first ${sdk})
file(GLOB_RECURSE texts ${sdk}/*.conf ${sdk}/*.cmake ${sdk}/*.pc ${sdk}/*.md)
list(APPEND texts ${lib}/liborbek.so ${sdk}/bin/orbek ${sdk}/bin/print_configuration)
foreach(text IN LISTS texts)
    foreach(place ${SCRATCH}/first ${BUILD})
        execute_process(COMMAND grep -qF ${place} ${text} RESULT_VARIABLE status)
        if(status EQUAL 0)
            message(FATAL_ERROR "${text} names ${place}")
        endif()
    endforeach()
endforeach()
foreach(file share/doc/orbek/manual/index.md share/doc/orbek/CARD.md share/doc/orbek/scan_formats.md
             share/orbek/examples/images/bob1.jpg share/orbek/examples/people/enrol.cpp
             share/orbek/examples/print_configuration.cpp)
    if(NOT EXISTS ${sdk}/${file})
        message(FATAL_ERROR "${file} is not installed")
    endif()
endforeach()

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
    -include orbek/corbek.h -include orbek/camera_plugin.h /dev/null)

# The library shows nothing but its public names.
run(symbols nm -DC --defined-only ${lib}/liborbek.so)
string(REGEX MATCHALL "[^\n]+" symbols "${symbols}")
list(LENGTH symbols count)
set(functions ${symbols})
list(FILTER functions INCLUDE REGEX " T orbek[A-Z][A-Za-z]*$")
list(LENGTH functions function_count)
list(FILTER symbols EXCLUDE REGEX " Orbek::| (vtable|typeinfo|typeinfo name) for Orbek::| T orbek[A-Z][A-Za-z]*$")
if(count LESS 50 OR symbols OR NOT function_count EQUAL 18)
    message(FATAL_ERROR "of ${count} visible symbols, ${function_count} of functions for C, these are not public: ${symbols}")
endif()
run(dynamic readelf -d ${lib}/liborbek.so)
if(NOT dynamic MATCHES "SONAME[^\n]*\\[liborbek\\.so\\.${VERSION}\\]")
    message(FATAL_ERROR "no SONAME: ${dynamic}")
endif()

# A photo if there is one, otherwise a gray picture without a face.
set(picture ${SOURCE}/../shared/data/scenes/faces/celeba_001719.jpg)
set(expected "1 face in 300 x 343 pixels")
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
set(examples ${sdk}/share/orbek/examples)
foreach(example find_faces people search_in_c camera)
    run(log ${CMAKE_COMMAND} -S ${examples}/${example} -B ${SCRATCH}/${example} -DCMAKE_PREFIX_PATH=${sdk}
        -DCMAKE_CXX_COMPILER=${COMPILER} -DCMAKE_C_COMPILER=${C_COMPILER})
    run(log ${CMAKE_COMMAND} --build ${SCRATCH}/${example})
endforeach()
run(output ${SCRATCH}/find_faces/find_faces ${configuration} ${picture})
check("${output}" "${expected}")
set(people ${examples}/images)
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
check("${output}" "^1 match\n[^\n]*alice.fir: ")

# ...and by pkg-config.
set(ENV{PKG_CONFIG_PATH} ${lib}/pkgconfig)
run(flags pkg-config --cflags --libs orbek)
separate_arguments(flags UNIX_COMMAND "${flags}")
run(log ${COMPILER} -std=c++20 ${examples}/find_faces/find_faces.cpp -o ${SCRATCH}/find_faces_again ${flags})
run(output ${SCRATCH}/find_faces_again ${configuration} ${picture})
check("${output}" "${expected}")
run(log ${C_COMPILER} -std=c99 ${examples}/search_in_c/search.c -o ${SCRATCH}/search ${flags})
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
run(output ${sdk}/bin/print_configuration ${configuration})
check("${output}" "ORBEK.Substitutions.INSTALLDIR\n[^\n]*\n    value        .ORBEKDIR\n")

# The ready-made device, and a camera that was built from what is installed.
file(WRITE ${SCRATCH}/device.cpp "
#include <orbek/capture_device.h>
#include <iostream>
int main(int, char** arguments) {
    Orbek::Configuration configuration{std::string(arguments[1])};
    configuration.setValue(\"ORBEK.CaptureDevices.bar\", \"VideoForLinux2\");
    configuration.setValue(\"ORBEK.FgDllCache.DllPaths.VideoForLinux2\", arguments[2]);
    for (const char* name : {\"Files\", \"bar\"}) {
        const Orbek::Image image = Orbek::createCaptureDevice(configuration, name)->capture();
        std::cout << name << ' ' << image->width() << ' ' << image->isColor() << '\\n';
    }
}
")
run(log ${COMPILER} -std=c++20 ${SCRATCH}/device.cpp -o ${SCRATCH}/device ${flags})
file(COPY ${configuration} DESTINATION ${SCRATCH})
run(output ${SCRATCH}/device ${SCRATCH}/orbek.conf ${SCRATCH}/camera/libcamera_example.so)
check("${output}" "^Files 320 1\nbar 320 0\n$")
