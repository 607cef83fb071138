# Libraries by purpose. FFmpeg is linked by helper programs only: it is under the GPL.
find_package(Threads REQUIRED)
find_package(PkgConfig REQUIRED)
pkg_check_modules(GIO REQUIRED IMPORTED_TARGET gio-2.0 gio-unix-2.0)  # mounts, applications, main loop
pkg_check_modules(ICU REQUIRED IMPORTED_TARGET icu-i18n icu-uc)       # case folding, names of months and days
pkg_check_modules(CAIRO REQUIRED IMPORTED_TARGET cairo)               # drawing
pkg_check_modules(PANGO REQUIRED IMPORTED_TARGET pangocairo)          # text on pictures
pkg_check_modules(RSVG REQUIRED IMPORTED_TARGET librsvg-2.0)          # icons
pkg_check_modules(PIXBUF REQUIRED IMPORTED_TARGET gdk-pixbuf-2.0)     # thumbnails: PNG with keys
pkg_check_modules(EXPAT REQUIRED IMPORTED_TARGET expat)               # XML property lists, a look at icons
pkg_check_modules(SQLITE REQUIRED IMPORTED_TARGET sqlite3)            # the metadata index
pkg_check_modules(FFMPEG REQUIRED IMPORTED_TARGET libavformat libavcodec libavutil libswscale)
pkg_check_modules(SECCOMP REQUIRED IMPORTED_TARGET libseccomp)        # walls around what reads foreign files
find_package(fmt REQUIRED)
find_package(nlohmann_json REQUIRED)
find_package(CLI11 REQUIRED)

set(VEXO_FRAMEWORK_LIBRARIES Threads::Threads PkgConfig::GIO PkgConfig::ICU PkgConfig::PIXBUF PkgConfig::EXPAT
    PkgConfig::SQLITE fmt::fmt nlohmann_json::nlohmann_json ${CMAKE_DL_LIBS})
set(VEXO_DRAWING_LIBRARIES PkgConfig::CAIRO PkgConfig::PANGO PkgConfig::RSVG PkgConfig::EXPAT)
