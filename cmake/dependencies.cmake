# The Debian packages that the tree is built with. Each is looked for by what calls it: what nothing calls is not linked.

find_package(PkgConfig REQUIRED)
pkg_check_modules(ICU REQUIRED IMPORTED_TARGET icu-uc)

# The hashes of passwords: MD5-crypt for the shadow file, DES and MD4 for Samba's.
pkg_check_modules(CRYPT REQUIRED IMPORTED_TARGET libcrypt)
pkg_check_modules(NETTLE REQUIRED IMPORTED_TARGET nettle)

# The account stores. Debian's package has neither a pkg-config file nor a CMake one.
find_path(BERKELEY_DB_INCLUDE_DIR db_185.h REQUIRED)

# None is linked by the library itself: a small one of its own is, and is loaded when it is first needed.
set(TAVO_EXTRAS_DEPENDENCIES PkgConfig::ICU PkgConfig::CRYPT PkgConfig::NETTLE db-5.3)
