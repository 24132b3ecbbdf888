# The Debian package of the provider: `cpack -G DEB` in the build tree.
# Its runtime dependencies are computed by dpkg-shlibdeps from the
# installed binaries; libqxplatform.so is private to the package (it sits
# beside the provider) and is looked up in the build tree.

set(SELPROV_MAINTAINER "SELProvider maintainers <selprovider@zan.example>")
set(SELPROV_RELEASE_DATE "Sun, 22 Nov 2026 12:00:00 +0000")

# Debian wants a copyright file and a compressed changelog in the package's
# documentation directory.
configure_file(${PROJECT_SOURCE_DIR}/packaging/changelog.in
               ${PROJECT_BINARY_DIR}/packaging/changelog @ONLY)
add_custom_command(
  OUTPUT ${PROJECT_BINARY_DIR}/packaging/changelog.gz
  COMMAND ${SELPROV_GZIP} -9nc ${PROJECT_BINARY_DIR}/packaging/changelog
          > ${PROJECT_BINARY_DIR}/packaging/changelog.gz
  DEPENDS ${PROJECT_BINARY_DIR}/packaging/changelog
  VERBATIM)
add_custom_target(selprov_package_docs ALL
  DEPENDS ${PROJECT_BINARY_DIR}/packaging/changelog.gz)
install(FILES ${PROJECT_SOURCE_DIR}/packaging/copyright
              ${PROJECT_BINARY_DIR}/packaging/changelog.gz
        DESTINATION ${SELPROV_DOC_DIR})

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME selprovider)
set(CPACK_PACKAGE_VENDOR ZAN)
set(CPACK_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_PACKAGE_CONTACT "${SELPROV_MAINTAINER}")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY
    "CMPI provider of the IPMI System Event Log")
# The extended description; CPack puts the summary above it.
set(CPACK_DEBIAN_PACKAGE_DESCRIPTION
"libSELProvider.so is a CMPI 2.0 provider for CIM object managers such as
SFCB and OpenPegasus. It presents the server's IPMI System Event Log as
instances of ZAN_MgmtHwLog and ZAN_MgmtHwLogEntry in the namespace
root/zanqx, clears the log through the ClearLog method, and raises
indications when records are added, the log is cleared or fills up, and
when the server restarts automatically.

The package holds the provider with its platform library, the MOF of its
classes, the SFCB and OpenPegasus registrations, selprovider-register to
register it with the object manager, and selprov to try the provider
without an object manager.")
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION admin)
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${PROJECT_BINARY_DIR}/lib)
set(CPACK_DEBIAN_PACKAGE_SUGGESTS sblim-wbemcli)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
# /etc/qx/platform.conf is the administrator's to edit: a conffile, kept on
# upgrades. Purging removes the state directory as well.
set(CPACK_DEBIAN_PACKAGE_CONTROL_EXTRA
    ${PROJECT_SOURCE_DIR}/packaging/conffiles
    ${PROJECT_SOURCE_DIR}/packaging/postrm)
set(CPACK_OUTPUT_FILE_PREFIX ${PROJECT_BINARY_DIR}/package)

include(CPack)
