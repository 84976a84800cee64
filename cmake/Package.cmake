# vorelix_package(TARGET DESCRIPTION REQUIRES): installs a shared library with NAME.pc and a CMake
# package, so that both pkg-config and find_package(NAME) find it.
function(vorelix_package name description requires)
    install(TARGETS ${name} EXPORT ${name}-targets LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
    install(EXPORT ${name}-targets NAMESPACE vorelix::
        DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/${name})

    set(dependencies "")
    foreach(dependency IN LISTS requires)
        string(APPEND dependencies "find_dependency(${dependency})\n")
    endforeach()
    file(CONFIGURE OUTPUT ${PROJECT_BINARY_DIR}/${name}-config.cmake @ONLY CONTENT
"include(CMakeFindDependencyMacro)
@dependencies@include(\${CMAKE_CURRENT_LIST_DIR}/${name}-targets.cmake)
")
    write_basic_package_version_file(${PROJECT_BINARY_DIR}/${name}-config-version.cmake
        VERSION ${PROJECT_VERSION} COMPATIBILITY SameMajorVersion)
    # The prefix is worked out from where the file stands, so an installed tree can be moved.
    file(CONFIGURE OUTPUT ${PROJECT_BINARY_DIR}/${name}.pc @ONLY CONTENT
"prefix=\${pcfiledir}/../..
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
