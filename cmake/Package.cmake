# vorelix_package(TARGET DESCRIPTION REQUIRES): gives a shared library its SONAME and installs it
# with NAME.pc and a CMake package, so that both pkg-config and find_package(NAME) find it and
# the packages that it REQUIRES.
function(vorelix_package name description requires)
    set_target_properties(${name} PROPERTIES
        VERSION ${PROJECT_VERSION}
        SOVERSION ${PROJECT_VERSION_MAJOR})
    set(own_names ${PROJECT_SOURCE_DIR}/cmake/own_names.map)
    target_link_options(${name} PRIVATE -Wl,--version-script=${own_names})
    set_property(TARGET ${name} APPEND PROPERTY LINK_DEPENDS ${own_names})
    # -z defs: a name that no library supplies fails here and not on the device. Not where the
    # names of the sanitizers come with the program: clang links their runtime there only.
    if(NOT (VORELIX_SANITIZE AND CMAKE_CXX_COMPILER_ID MATCHES "Clang"))
        target_link_options(${name} PRIVATE -Wl,-z,defs)
    endif()

    install(TARGETS ${name} EXPORT ${name}-targets LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
    install(EXPORT ${name}-targets NAMESPACE vorelix::
        DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/${name})

    set(dependencies "")
    foreach(dependency IN LISTS requires)
        if(dependency STREQUAL "jsoncpp")
            # Its package fails when it is read a second time.
            string(APPEND dependencies "if(NOT TARGET JsonCpp::JsonCpp)\n")
            string(APPEND dependencies "    find_dependency(jsoncpp)\nendif()\n")
        else()
            string(APPEND dependencies "find_dependency(${dependency})\n")
        endif()
    endforeach()
    file(CONFIGURE OUTPUT ${PROJECT_BINARY_DIR}/${name}-config.cmake @ONLY CONTENT
"include(CMakeFindDependencyMacro)
@dependencies@include(\${CMAKE_CURRENT_LIST_DIR}/${name}-targets.cmake)
")
    write_basic_package_version_file(${PROJECT_BINARY_DIR}/${name}-config-version.cmake
        VERSION ${PROJECT_VERSION} COMPATIBILITY SameMajorVersion)
    list(JOIN requires " " requires)
    # The prefix is worked out from where the file stands, so an installed tree can be moved. How
    # far up it is depends on the library folder, which may be lib/<architecture>.
    file(RELATIVE_PATH pc_to_prefix
        /prefix/${CMAKE_INSTALL_LIBDIR}/pkgconfig /prefix)
    string(REGEX REPLACE "/$" "" pc_to_prefix ${pc_to_prefix})
    file(CONFIGURE OUTPUT ${PROJECT_BINARY_DIR}/${name}.pc @ONLY CONTENT
"prefix=\${pcfiledir}/@pc_to_prefix@
libdir=\${prefix}/@CMAKE_INSTALL_LIBDIR@
includedir=\${prefix}/@CMAKE_INSTALL_INCLUDEDIR@

Name: lib@name@
Description: @description@
Version: @PROJECT_VERSION@
Requires: @requires@
Libs: -L\${libdir} -l@name@
Cflags: -I\${includedir}
")
    install(FILES ${PROJECT_BINARY_DIR}/${name}-config.cmake
        ${PROJECT_BINARY_DIR}/${name}-config-version.cmake
        DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/${name})
    install(FILES ${PROJECT_BINARY_DIR}/${name}.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
endfunction()
