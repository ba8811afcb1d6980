# What the library stands on, found once; the reasons are in docs/decisions/.

find_package(PkgConfig REQUIRED)
pkg_check_modules(uriparser REQUIRED IMPORTED_TARGET liburiparser)
pkg_check_modules(libxml2 REQUIRED IMPORTED_TARGET libxml-2.0)
pkg_check_modules(libmd REQUIRED IMPORTED_TARGET libmd)
find_package(ZLIB REQUIRED)
find_package(Threads REQUIRED)

# Decoders of compressed audio, in a module of their own; without these packages the library has none.
pkg_check_modules(decoding IMPORTED_TARGET libavformat libavcodec libswresample libavutil wavpack)
option(KTFILES_WITH_FFMPEG "Build the decoder module" ${decoding_FOUND})

# Tags of formats that the library does not annotate, in another module; without TagLib the library has none.
pkg_check_modules(taglib IMPORTED_TARGET taglib)
option(KTFILES_WITH_TAGLIB "Build the module of tags" ${taglib_FOUND})

# Loudness by EBU R 128, in another module; without libebur128 none is measured.
pkg_check_modules(ebur128 IMPORTED_TARGET libebur128)
option(KTFILES_WITH_EBUR128 "Build the module that measures loudness" ${ebur128_FOUND})

# The server of pages, in a module of the command; without cpp-httplib no page is served.
pkg_check_modules(httplib IMPORTED_TARGET cpp-httplib)
option(KTFILES_WITH_SERVER "Build the module that serves pages" ${httplib_FOUND})
