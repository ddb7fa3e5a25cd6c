# The Debian package: "make deb" (or "cpack -G DEB" in the build folder) puts what
# "cmake --install" installs under /usr into quillane_<version>_<arch>.deb. dpkg-shlibdeps
# works out the library packages from the programs themselves; deb_staging.cmake adds what
# Debian's policy asks of every package (copyright file, compressed changelog and manual page).
set(QUILLANE_DEB_MAINTAINER "Quillane maintainers <maintainers@quillane.invalid>"
    CACHE STRING "The Maintainer field of the Debian package")

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME quillane)
set(CPACK_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "turn photographs into artwork")
# The synopsis is the summary above; CPack indents these lines and marks the empty one.
set(CPACK_DEBIAN_PACKAGE_DESCRIPTION
    "Quillane opens one picture at a time in a zoomable window and turns it into
artwork with seventeen effects: pencil and pen sketches, colour pencil, water
colour, pop art, emboss, texture and more, each in a small tool window with an
undo history. A whole folder of pictures can be converted at once.

The quillane-cli command runs the same effects without any window.")
set(CPACK_DEBIAN_PACKAGE_MAINTAINER "${QUILLANE_DEB_MAINTAINER}")
set(CPACK_DEBIAN_PACKAGE_SECTION graphics)
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set(CPACK_DEBIAN_PACKAGE_HOMEPAGE "https://quillane.github.io")
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
# Folders and the mail hand-over go through the desktop's own programs.
set(CPACK_DEBIAN_PACKAGE_RECOMMENDS "xdg-utils")
set(CPACK_PRE_BUILD_SCRIPTS ${CMAKE_CURRENT_LIST_DIR}/deb_staging.cmake)
# Read by deb_staging.cmake inside cpack.
set(CPACK_QUILLANE_PACKAGING_DIR ${CMAKE_CURRENT_LIST_DIR})
set(CPACK_QUILLANE_VERSION ${PROJECT_VERSION})
include(CPack)
