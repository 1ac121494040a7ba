# Everything the library calls but does not write itself. Their headers stay inside .cpp files.
find_package(PkgConfig REQUIRED)
find_package(ICU REQUIRED COMPONENTS uc i18n)
find_package(fmt REQUIRED)
find_package(spdlog REQUIRED)
pkg_check_modules(libplist REQUIRED IMPORTED_TARGET libplist-2.0)
