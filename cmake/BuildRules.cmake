# What every target of this tree is compiled with, and how a folder becomes one.

set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_C_STANDARD 11)
set(CMAKE_C_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_C_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)

add_library(vorelix_rules INTERFACE)
target_compile_options(vorelix_rules INTERFACE
    -Wall -Wextra -Wpedantic -Wconversion -Wshadow -Wformat=2 -Werror)
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    # GCC 12 with optimisation sees overlaps in std::string's operator+ that are not there.
    target_compile_options(vorelix_rules INTERFACE $<$<NOT:$<CONFIG:Debug>>:-Wno-restrict>)
endif()
target_compile_definitions(vorelix_rules INTERFACE
    ZANO_ROOT="${ZANO_ROOT}" _FILE_OFFSET_BITS=64)
if(VORELIX_SANITIZE)
    target_compile_options(vorelix_rules INTERFACE
        -fsanitize=address,undefined -fno-sanitize-recover=all -fno-omit-frame-pointer)
    target_link_options(vorelix_rules INTERFACE -fsanitize=address,undefined)
endif()

# vorelix_unit(NAME SOURCES... DEPENDS...): a folder as a target of its own, so that it can use
# only what it names. Units end up in one shared library.
function(vorelix_unit name)
    cmake_parse_arguments(unit "" "" "SOURCES;DEPENDS" ${ARGN})
    add_library(${name} OBJECT ${unit_SOURCES})
    target_link_libraries(${name} PRIVATE vorelix_rules ${unit_DEPENDS})
endfunction()

# vorelix_headers(PACKAGE FOLDER FILES...): headers that callers include as <PACKAGE/FOLDER/...>.
# They appear under that name in the build tree too, and are installed. FOLDER may be "".
function(vorelix_headers package folder)
    set(staged ${PROJECT_BINARY_DIR}/include/${package}/${folder})
    file(MAKE_DIRECTORY ${staged})
    foreach(header IN LISTS ARGN)
        get_filename_component(name ${header} NAME)
        file(CREATE_LINK ${CMAKE_CURRENT_SOURCE_DIR}/${header} ${staged}/${name} SYMBOLIC)
        set_property(GLOBAL APPEND PROPERTY VORELIX_EXPORTED_HEADERS ${package}/${folder}/${name})
    endforeach()
    install(FILES ${ARGN} DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/${package}/${folder})
endfunction()
