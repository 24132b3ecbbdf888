# Where `cmake --install` (and so the Debian package) puts the provider:
#   <prefix>/${SELPROV_PROVIDER_DIR}/libSELProvider.so  and libqxplatform.so
#   <prefix>/bin/selprov
#   <prefix>/sbin/selprovider-register
#   <prefix>/share/selprovider/  MOF and registrations
#   <prefix>/share/doc/selprovider/  deployment guide (and Debian's files)
#   /etc/qx/platform.conf  the platform configuration (mode 0600)
#   /var/lib/qx-platform/  the platform's state directory (mode 0700)
include(GNUInstallDirs)

set(SELPROV_PROVIDER_DIR "lib/cmpi" CACHE STRING
    "Where the CMPI provider library is installed, relative to the install \
prefix or absolute: a directory the object manager searches for providers \
(SFCB providerDirs, OpenPegasus providerDir)")
set(SELPROV_DATA_DIR "${CMAKE_INSTALL_DATADIR}/selprovider")
set(SELPROV_DOC_DIR "${CMAKE_INSTALL_DATADIR}/doc/selprovider")
# The platform reads its configuration from this fixed directory and keeps
# its state in the other by default, whatever the install prefix.
set(SELPROV_CONFIG_DIR "/etc/qx")
set(SELPROV_STATE_DIR "/var/lib/qx-platform")

# The provider directory as seen from another installed directory: relative
# to it when both are under the prefix (so the installation can be moved,
# and the package installs under another prefix), absolute otherwise.
function(selprov_provider_dir_from from_dir out_var)
  if(IS_ABSOLUTE "${SELPROV_PROVIDER_DIR}")
    set(${out_var} "${SELPROV_PROVIDER_DIR}" PARENT_SCOPE)
  elseif(IS_ABSOLUTE "${from_dir}")
    set(${out_var} "${CMAKE_INSTALL_PREFIX}/${SELPROV_PROVIDER_DIR}" PARENT_SCOPE)
  else()
    file(RELATIVE_PATH relative "/prefix/${from_dir}"
         "/prefix/${SELPROV_PROVIDER_DIR}")
    set(${out_var} "${relative}" PARENT_SCOPE)
  endif()
endfunction()

# The installed library as selprov finds it by default.
selprov_provider_dir_from("${CMAKE_INSTALL_BINDIR}" selprov_provider_dir)
set(SELPROV_INSTALLED_LIBRARY "${selprov_provider_dir}/libSELProvider.so")

# Installed files and directories get the usual modes whatever the umask
# of the build.
set(CMAKE_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE
    GROUP_READ GROUP_EXECUTE
    WORLD_READ WORLD_EXECUTE)

# Manual pages and the Debian changelog are installed compressed.
find_program(SELPROV_GZIP gzip REQUIRED)
