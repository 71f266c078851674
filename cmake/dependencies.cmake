# The Debian packages that the tree is built with. Each is looked for by what calls it: what nothing calls is not linked.

find_package(PkgConfig REQUIRED)
pkg_check_modules(ICU REQUIRED IMPORTED_TARGET icu-uc)
set(TAVO_LIBRARY_DEPENDENCIES PkgConfig::ICU)
