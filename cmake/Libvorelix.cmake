# libvorelix.so, from the units, with what an outside build needs to find it.

# Where the platform library is another one, the units see of it what its package names.
if(NOT TARGET zanoplatform_headers)
    add_library(zanoplatform_headers INTERFACE)
    target_link_libraries(zanoplatform_headers INTERFACE vorelix_base vorelix::zanoplatform)
endif()

add_library(vorelix SHARED
    $<TARGET_OBJECTS:vorelix_misc>
    $<TARGET_OBJECTS:vorelix_library>
    $<TARGET_OBJECTS:vorelix_playlists>
    $<TARGET_OBJECTS:vorelix_ipod>
    $<TARGET_OBJECTS:vorelix_player>
    $<TARGET_OBJECTS:vorelix_config>
    $<TARGET_OBJECTS:vorelix_users>
    $<TARGET_OBJECTS:vorelix_web>
    $<TARGET_OBJECTS:vorelix_upnp>)
add_library(vorelix::vorelix ALIAS vorelix)
# Public, for callers release the lists that they get with a function of the platform, and some
# hand over JSON values.
target_link_libraries(vorelix
    PUBLIC vorelix::zanoplatform JsonCpp::JsonCpp
    PRIVATE vorelix_rules PkgConfig::libxml2)
target_include_directories(vorelix INTERFACE
    $<BUILD_INTERFACE:${PROJECT_BINARY_DIR}/include>
    $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)

vorelix_package(vorelix "The server side of an audio application on a storage device"
    "zanoplatform;jsoncpp")
