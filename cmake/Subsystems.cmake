# A subsystem is a folder below src/. It becomes one object library, and it may include only its own headers and
# those of the subsystems that it names behind USES; a forbidden include stops the build.

# orbek_check_includes(<stamp> ALLOWED <folder>... FILES <file>...): a rule that makes the stamp, or stops the build.
function(orbek_check_includes stamp)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "ALLOWED;FILES")
    list(GET arg_ALLOWED 0 folder)
    add_custom_command(
        OUTPUT ${stamp}
        COMMAND ${CMAKE_COMMAND} "-DALLOWED=${arg_ALLOWED}" "-DFILES=${arg_FILES}" -DSTAMP=${stamp}
                -P ${CMAKE_SOURCE_DIR}/cmake/check_layers.cmake
        DEPENDS ${arg_FILES} ${CMAKE_SOURCE_DIR}/cmake/check_layers.cmake
        COMMENT "Checking what ${folder} includes"
        VERBATIM)
endfunction()

# orbek_subsystem(<folder> [USES <folder>...] [LIBRARIES <target>...])
#
# Defines the object library orbek_<folder, "/" replaced by "_"> from all sources below src/<folder>, without those
# of a subsystem that lies deeper. A subsystem that lies deeper is declared after the one around it.
function(orbek_subsystem folder)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "USES;LIBRARIES")
    string(REPLACE "/" "_" target "orbek_${folder}")
    set(root ${CMAKE_SOURCE_DIR}/src/${folder})

    file(GLOB_RECURSE sources CONFIGURE_DEPENDS ${root}/*.cpp)
    file(GLOB_RECURSE headers CONFIGURE_DEPENDS ${root}/*.h)
    if(folder STREQUAL "fn")
        list(FILTER sources EXCLUDE REGEX "/src/fn/deployment/")
        list(FILTER headers EXCLUDE REGEX "/src/fn/deployment/")
    endif()

    set(stamp ${CMAKE_CURRENT_BINARY_DIR}/${target}.layers)
    orbek_check_includes(${stamp} ALLOWED ${folder} ${arg_USES} FILES ${sources} ${headers})

    # Neither the objects nor the libraries of a used object library travel along; each target names the whole set.
    set(closure ${target})
    set(libraries ${arg_LIBRARIES})
    foreach(used IN LISTS arg_USES)
        if(used MATCHES "^${folder}/")
            continue() # a part of this one
        endif()
        string(REPLACE "/" "_" used_target "orbek_${used}")
        get_target_property(below ${used_target} ORBEK_CLOSURE)
        get_target_property(libraries_below ${used_target} ORBEK_LIBRARIES)
        list(APPEND closure ${below})
        list(APPEND libraries ${libraries_below})
    endforeach()
    list(REMOVE_DUPLICATES closure)
    list(REMOVE_DUPLICATES libraries)

    add_library(${target} OBJECT ${sources} ${stamp})
    target_include_directories(${target} PUBLIC ${CMAKE_SOURCE_DIR}/src)
    target_link_libraries(${target} PUBLIC ${libraries})
    set_target_properties(${target} PROPERTIES ORBEK_CLOSURE "${closure}" ORBEK_LIBRARIES "${libraries}")
endfunction()

# orbek_public_headers(<folder>): the headers directly in a subsystem's folder are installed, so they may include one
# another only.
function(orbek_public_headers folder)
    file(GLOB headers CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/src/${folder}/*.h)
    set(stamp ${CMAKE_CURRENT_BINARY_DIR}/orbek_${folder}_public.layers)
    orbek_check_includes(${stamp} ALLOWED ${folder} FILES ${headers})
    target_sources(orbek_${folder} PRIVATE ${stamp})
    install(FILES ${headers} DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/${folder})
endfunction()

# orbek_link(<target> <folder>): links the objects of a subsystem and of all that it uses.
function(orbek_link target folder)
    string(REPLACE "/" "_" subsystem "orbek_${folder}")
    get_target_property(closure ${subsystem} ORBEK_CLOSURE)
    target_link_libraries(${target} PRIVATE ${closure})
endfunction()
