# The Debian packages that the tree is built with. Each is looked for by what calls it: what nothing calls is not linked.

find_package(PkgConfig REQUIRED)
pkg_check_modules(ICU REQUIRED IMPORTED_TARGET icu-uc)

# The account stores. Debian's package has neither a pkg-config file nor a CMake one.
find_path(BERKELEY_DB_INCLUDE_DIR db_185.h REQUIRED)

set(TAVO_LIBRARY_DEPENDENCIES PkgConfig::ICU db-5.3)
