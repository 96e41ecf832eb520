# Every library from outside, as one imported target each.
find_package(PkgConfig REQUIRED)
find_package(Threads REQUIRED)

pkg_check_modules(GIO REQUIRED IMPORTED_TARGET gio-2.0)
pkg_check_modules(PLIST REQUIRED IMPORTED_TARGET libplist-2.0)
pkg_check_modules(CUPSFILTERS REQUIRED IMPORTED_TARGET libcupsfilters)
pkg_check_modules(LIBUSB REQUIRED IMPORTED_TARGET libusb-1.0)
pkg_check_modules(DNSSD REQUIRED IMPORTED_TARGET avahi-compat-libdns_sd)
pkg_check_modules(AVAHI REQUIRED IMPORTED_TARGET avahi-client)
pkg_check_modules(UDEV REQUIRED IMPORTED_TARGET libudev)
find_package(nlohmann_json REQUIRED)

# Debian's libcups2-dev has cups-config but no pkg-config file.
find_path(CUPS_INCLUDE_DIR cups/cups.h REQUIRED)
find_library(CUPS_LIBRARY cups REQUIRED)
add_library(Cups::cups UNKNOWN IMPORTED)
set_target_properties(Cups::cups PROPERTIES IMPORTED_LOCATION ${CUPS_LIBRARY}
                                            INTERFACE_INCLUDE_DIRECTORIES ${CUPS_INCLUDE_DIR})
