# Where `cmake --install` (and so the Debian package) puts the provider:
#   <prefix>/${SELPROV_PROVIDER_DIR}/libSELProvider.so  and libqxplatform.so
#   <prefix>/bin/selprov
#   <prefix>/sbin/selprovider-register
#   <prefix>/share/selprovider/  MOF, registrations, example configuration
#   <prefix>/share/doc/selprovider/  deployment guide (and Debian's files)
include(GNUInstallDirs)

set(SELPROV_PROVIDER_DIR "lib/cmpi" CACHE STRING
    "Where the CMPI provider library is installed, relative to the install \
prefix or absolute: a directory the object manager searches for providers \
(SFCB providerDirs, OpenPegasus providerDir)")
set(SELPROV_DATA_DIR "${CMAKE_INSTALL_DATADIR}/selprovider")
set(SELPROV_DOC_DIR "${CMAKE_INSTALL_DATADIR}/doc/selprovider")

# The installed library as selprov finds it by default: relative to the
# directory of the selprov executable when both are under the prefix.
if(IS_ABSOLUTE "${SELPROV_PROVIDER_DIR}" OR IS_ABSOLUTE "${CMAKE_INSTALL_BINDIR}")
  if(IS_ABSOLUTE "${SELPROV_PROVIDER_DIR}")
    set(SELPROV_INSTALLED_LIBRARY "${SELPROV_PROVIDER_DIR}/libSELProvider.so")
  else()
    set(SELPROV_INSTALLED_LIBRARY
        "${CMAKE_INSTALL_PREFIX}/${SELPROV_PROVIDER_DIR}/libSELProvider.so")
  endif()
else()
  file(RELATIVE_PATH selprov_bin_to_provider
       "/prefix/${CMAKE_INSTALL_BINDIR}" "/prefix/${SELPROV_PROVIDER_DIR}")
  set(SELPROV_INSTALLED_LIBRARY "${selprov_bin_to_provider}/libSELProvider.so")
endif()

# Installed files and directories get the usual modes whatever the umask
# of the build.
set(CMAKE_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE
    GROUP_READ GROUP_EXECUTE
    WORLD_READ WORLD_EXECUTE)

# Manual pages and the Debian changelog are installed compressed.
find_program(SELPROV_GZIP gzip REQUIRED)
