# Debian packages: host, tools, development, and the shared libraries that all of them need.
set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME quorix-control-stream)
set(CPACK_PACKAGE_VENDOR "Quorix")
set(CPACK_PACKAGE_CONTACT "Quorix maintainers <maintainers@quorix.invalid>")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_COMPONENTS_ALL host tools development libraries)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_COMPONENTS_GROUPING ONE_PER_GROUP)
set(CPACK_COMPONENT_UNSPECIFIED_REQUIRED OFF)

set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION misc)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${PROJECT_BINARY_DIR}/lib)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)

set(ourLibraries "quorix-control-stream-libraries (= ${PROJECT_VERSION})")

set(CPACK_DEBIAN_LIBRARIES_PACKAGE_NAME quorix-control-stream-libraries)
set(CPACK_COMPONENT_LIBRARIES_DESCRIPTION "Quorix control stream: what its parts share
 Log, schema table and display scale, of which host and plug-in must see one instance.")

set(CPACK_DEBIAN_HOST_PACKAGE_NAME quorix-control-stream-host)
set(CPACK_DEBIAN_HOST_PACKAGE_DEPENDS "${ourLibraries}, libqt5svg5, qml-module-qtquick2, \
qml-module-qtquick-window2, qml-module-qtquick-layouts, qml-module-qtquick-controls2, \
qml-module-qtquick-templates2")
set(CPACK_DEBIAN_HOST_PACKAGE_RECOMMENDS "avahi-daemon")
set(CPACK_COMPONENT_HOST_DESCRIPTION "Quorix control stream: the plug-in and its reference host
 Lets remote control devices drive a motion-capture host over the local network.")

set(CPACK_DEBIAN_TOOLS_PACKAGE_NAME quorix-control-stream-tools)
set(CPACK_DEBIAN_TOOLS_PACKAGE_DEPENDS "${ourLibraries}")
set(CPACK_DEBIAN_TOOLS_PACKAGE_SUGGESTS "bash-completion, python3, wireshark-common")
set(CPACK_COMPONENT_TOOLS_DESCRIPTION "Quorix control stream: the device's side
 The command line korva-control, a fake host for tests, and the client for Python.")

set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_NAME quorix-control-stream-dev)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS "${ourLibraries}, libboost-dev, libboost-thread-dev, \
libboost-filesystem-dev, librapidxml-dev")
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SUGGESTS "libavahi-client-dev, pkg-config, cmake")
set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION "Quorix control stream: development files
 The client library for makers of devices, the plug-in interfaces, and the data store.")

include(CPack)
