# Links shared library <target> with the version script <script>: the
# library exports what the script names and nothing else, is relinked when
# the script changes, and resolves every symbol when it is linked (except
# in the builds that leave that to the executable, SELPROV_NO_UNDEFINED).
function(selprov_version_script target script)
  target_link_options(${target} PRIVATE
    -Wl,--version-script=${script}
    ${SELPROV_NO_UNDEFINED})
  set_target_properties(${target} PROPERTIES LINK_DEPENDS ${script})
endfunction()
