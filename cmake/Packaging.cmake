# The Debian package: `cpack` in a build folder, or scripts/package.

# udev, systemd, polkit, the bus and the scheduler read their folders below /usr and nowhere else.
if(CMAKE_INSTALL_PREFIX_INITIALIZED_TO_DEFAULT)
  set_property(CACHE CMAKE_INSTALL_PREFIX PROPERTY VALUE /usr)
endif()

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_CONTACT "ventrasagent maintainers <maintainers@ventrasagent.invalid>")
set(CPACK_PACKAGE_VENDOR "ventrasagent maintainers")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "sets up print queues without asking")
set(CPACK_PACKAGE_DESCRIPTION
"ventrasagent is the background agent of a desktop's print system: told
which devices are there, it finds out what each of them is, chooses a
driver and makes a CUPS queue for it. It serves USB printers, printers
that speak IPP over USB, network printers that need no driver, and
scanners; queues that exist already are left alone. For printers without
a driver it looks for a package that has one.
.
USB printers are set up when they are plugged in. The program ventrasctl
shows what the agent sees, decides and would do.")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)

set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_RELEASE 1)
set(CPACK_DEBIAN_PACKAGE_SECTION net)
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
# What programs are linked with is found out. libcupsfilters is opened when a printer is asked what it can do.
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_DEPENDS "cups, cups-client, cups-filters, ghostscript, libcupsfilters1")
set(CPACK_DEBIAN_PACKAGE_RECOMMENDS
    "avahi-daemon, default-dbus-session-bus | dbus-session-bus, ipp-usb, packagekit, polkitd, udev")
set(CPACK_DEBIAN_PACKAGE_SUGGESTS "cups-ppdc, printer-driver-all, zenity | kdialog")
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
foreach(script preinst postinst prerm postrm triggers)
  list(APPEND CPACK_DEBIAN_PACKAGE_CONTROL_EXTRA ${PROJECT_SOURCE_DIR}/data/debian/${script})
endforeach()

# Packing builds nothing: the tests would have to be built as well. The target below is what it needs.
set(CMAKE_SKIP_INSTALL_ALL_DEPENDENCY ON)
add_custom_target(ventras-installed)

# One package of everything, with the one part that an installation by hand leaves out.
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_COMPONENTS_GROUPING ALL_COMPONENTS_IN_ONE)
set(CPACK_COMPONENTS_ALL Unspecified diverted)
include(CPack)
