# The libraries that the host stands on. Each is a Debian package named in scripts/install-deps.

find_package(PkgConfig REQUIRED)
find_package(Threads REQUIRED)

pkg_check_modules(libzip REQUIRED IMPORTED_TARGET libzip)
pkg_check_modules(harfbuzz REQUIRED IMPORTED_TARGET harfbuzz harfbuzz-subset)
pkg_check_modules(icu REQUIRED IMPORTED_TARGET icu-uc icu-i18n)
pkg_check_modules(freetype REQUIRED IMPORTED_TARGET freetype2)
pkg_check_modules(fontconfig REQUIRED IMPORTED_TARGET fontconfig)
pkg_check_modules(lcms2 REQUIRED IMPORTED_TARGET lcms2)
pkg_check_modules(cairo REQUIRED IMPORTED_TARGET cairo cairo-ft)
pkg_check_modules(png REQUIRED IMPORTED_TARGET libpng)
pkg_check_modules(jpeg REQUIRED IMPORTED_TARGET libjpeg)
pkg_check_modules(qpdf REQUIRED IMPORTED_TARGET libqpdf)
pkg_check_modules(exempi REQUIRED IMPORTED_TARGET exempi-2.0)
pkg_check_modules(deflate REQUIRED IMPORTED_TARGET libdeflate)
pkg_check_modules(cmarkgfm REQUIRED IMPORTED_TARGET libcmark-gfm)
pkg_check_modules(tomlplusplus REQUIRED IMPORTED_TARGET tomlplusplus)

find_library(KORVANE_HYPHEN hyphen REQUIRED)
find_library(KORVANE_CMARK_EXTENSIONS cmark-gfm-extensions REQUIRED)
find_package(CLI11 REQUIRED)
find_package(nlohmann_json REQUIRED)
