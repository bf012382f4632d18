# minizip's zip writer (zip.c, ioapi.c, iowin32.c from zlib's contrib/minizip)
# is compiled from Debian's zlib source package, fetched into the build folder
# at configure time and never kept in the repository. scripts/install-deps.sh
# adds the deb-src entry that `apt-get source` needs.
#
# Defines: qm_minizip (static library for the target, with zlib) and
# QM_MINIZIP_DIR (the unpacked contrib/minizip folder, for the benchmark's
# baseline tool minizip.c).

set(QM_ZLIB_SOURCE_VERSION 1.2.13.dfsg)
set(QM_ZLIB_ORIG_SHA256 71feb7947e3c00ef125f83b79a4e529bde31171e5babe48b391f06758d1ab0a1)
set(QM_ZLIB_SOURCE_ROOT ${CMAKE_BINARY_DIR}/zlib-source)
set(QM_ZLIB_ORIG ${QM_ZLIB_SOURCE_ROOT}/zlib_${QM_ZLIB_SOURCE_VERSION}.orig.tar.bz2)
set(QM_MINIZIP_DIR ${QM_ZLIB_SOURCE_ROOT}/zlib-${QM_ZLIB_SOURCE_VERSION}/contrib/minizip)
set(QM_ZLIB_TARGET_LIBRARY /usr/i686-w64-mingw32/lib/libz.a)

set(qm_minizip_hint "Run scripts/install-deps.sh (it adds the deb-src entry for Debian's \
zlib source package and runs apt-get update), then configure again.")

if(NOT EXISTS ${QM_MINIZIP_DIR}/zip.c)
  file(MAKE_DIRECTORY ${QM_ZLIB_SOURCE_ROOT})
  if(NOT EXISTS ${QM_ZLIB_ORIG})
    message(STATUS "Fetching Debian's zlib source package for minizip")
    execute_process(COMMAND apt-get source --download-only zlib
                    WORKING_DIRECTORY ${QM_ZLIB_SOURCE_ROOT}
                    RESULT_VARIABLE fetch_result OUTPUT_QUIET ERROR_VARIABLE fetch_errors)
    if(NOT EXISTS ${QM_ZLIB_ORIG})
      message(FATAL_ERROR "minizip: `apt-get source --download-only zlib` gave no \
zlib_${QM_ZLIB_SOURCE_VERSION}.orig.tar.bz2 (the zlib version this build expects) in \
${QM_ZLIB_SOURCE_ROOT}. ${qm_minizip_hint}\n${fetch_errors}")
    endif()
  endif()
  file(SHA256 ${QM_ZLIB_ORIG} orig_sha256)
  if(NOT orig_sha256 STREQUAL QM_ZLIB_ORIG_SHA256)
    message(FATAL_ERROR "minizip: ${QM_ZLIB_ORIG} is not Debian's zlib ${QM_ZLIB_SOURCE_VERSION} \
source (SHA-256 ${orig_sha256}). Remove it and configure again.")
  endif()
  execute_process(COMMAND tar -xjf ${QM_ZLIB_ORIG} zlib-${QM_ZLIB_SOURCE_VERSION}/contrib/minizip
                  WORKING_DIRECTORY ${QM_ZLIB_SOURCE_ROOT} RESULT_VARIABLE unpack_result)
  if(NOT unpack_result EQUAL 0 OR NOT EXISTS ${QM_MINIZIP_DIR}/zip.c)
    message(FATAL_ERROR "minizip: could not unpack contrib/minizip from ${QM_ZLIB_ORIG}.")
  endif()
endif()

if(NOT EXISTS ${QM_ZLIB_TARGET_LIBRARY})
  message(FATAL_ERROR "zlib for the target is missing (${QM_ZLIB_TARGET_LIBRARY}): install \
libz-mingw-w64-dev (scripts/install-deps.sh).")
endif()

# Outside code: compiled as its authors wrote it, without our warning flags.
add_library(qm_minizip STATIC ${QM_MINIZIP_DIR}/zip.c ${QM_MINIZIP_DIR}/ioapi.c
                              ${QM_MINIZIP_DIR}/iowin32.c)
target_include_directories(qm_minizip SYSTEM PUBLIC ${QM_MINIZIP_DIR})
target_compile_definitions(qm_minizip PRIVATE NOCRYPT NOUNCRYPT)
target_compile_options(qm_minizip PRIVATE -w)
target_link_libraries(qm_minizip PUBLIC ${QM_ZLIB_TARGET_LIBRARY})
