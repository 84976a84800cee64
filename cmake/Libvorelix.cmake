# libvorelix.so, from the units, with what an outside build needs to find it.

add_library(vorelix SHARED
    $<TARGET_OBJECTS:vorelix_misc>
    $<TARGET_OBJECTS:vorelix_library>
    $<TARGET_OBJECTS:vorelix_playlists>)
add_library(vorelix::vorelix ALIAS vorelix)
target_link_libraries(vorelix PRIVATE vorelix_rules zanoplatform)
target_include_directories(vorelix INTERFACE
    $<BUILD_INTERFACE:${PROJECT_BINARY_DIR}/include>
    $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
set_target_properties(vorelix PROPERTIES
    VERSION ${PROJECT_VERSION}
    SOVERSION ${PROJECT_VERSION_MAJOR})
# -z defs: a name that no library supplies fails here and not on the device.
target_link_options(vorelix PRIVATE -Wl,-z,defs)

vorelix_package(vorelix "The server side of an audio application on a storage device"
    "zanoplatform")
