# Checks that the provider reaches the platform only through its public
# headers, and that those keep FreeIPMI to the platform. Run as
#   cmake -DPLATFORM_DIR=<dir> -DHEADERS=<a.h,b.h,...>
#         -DCONSUMERS=<dir,dir,...> -P CheckPublicHeaders.cmake
# Every `#include "X"` in the files under the CONSUMERS directories that
# names a header of PLATFORM_DIR (and not one beside the including file)
# must name one of HEADERS; every one of HEADERS must exist, include no
# FreeIPMI header and include no platform header that is not in HEADERS.

foreach(variable PLATFORM_DIR HEADERS CONSUMERS)
  if(NOT DEFINED ${variable})
    message(FATAL_ERROR "CheckPublicHeaders: ${variable} is not set")
  endif()
endforeach()
string(REPLACE "," ";" public_headers "${HEADERS}")
string(REPLACE "," ";" consumers "${CONSUMERS}")
set(problems "")

# The quoted includes of <file>, in <out>.
function(quoted_includes file out)
  file(STRINGS "${file}" lines REGEX "^[ \t]*#[ \t]*include[ \t]*\"")
  set(names "")
  foreach(line IN LISTS lines)
    string(REGEX REPLACE "^[ \t]*#[ \t]*include[ \t]*\"([^\"]+)\".*" "\\1"
           name "${line}")
    list(APPEND names "${name}")
  endforeach()
  set(${out} "${names}" PARENT_SCOPE)
endfunction()

# Records a problem when <name>, included by <where>, is not public.
macro(require_public name where)
  list(FIND public_headers "${name}" at)
  if(at EQUAL -1)
    list(APPEND problems
         "${where}: includes ${name}, which is not a public header")
  endif()
endmacro()

foreach(consumer IN LISTS consumers)
  if(NOT IS_DIRECTORY "${consumer}")
    list(APPEND problems "${consumer}: not a directory")
    continue()
  endif()
  file(GLOB_RECURSE files "${consumer}/*.h" "${consumer}/*.cpp"
       "${consumer}/*.c")
  foreach(file IN LISTS files)
    get_filename_component(here "${file}" DIRECTORY)
    quoted_includes("${file}" names)
    foreach(name IN LISTS names)
      if(NOT EXISTS "${here}/${name}" AND EXISTS "${PLATFORM_DIR}/${name}")
        require_public("${name}" "${file}")
      endif()
    endforeach()
  endforeach()
endforeach()

foreach(header IN LISTS public_headers)
  set(path "${PLATFORM_DIR}/${header}")
  if(NOT EXISTS "${path}")
    list(APPEND problems "${header}: listed as public but does not exist")
    continue()
  endif()
  file(STRINGS "${path}" freeipmi REGEX "^[ \t]*#[ \t]*include[ \t]*<freeipmi")
  if(freeipmi)
    list(APPEND problems "${header}: includes FreeIPMI (${freeipmi})")
  endif()
  get_filename_component(header_dir "${header}" DIRECTORY)
  quoted_includes("${path}" names)
  foreach(name IN LISTS names)
    if(header_dir AND EXISTS "${PLATFORM_DIR}/${header_dir}/${name}")
      set(name "${header_dir}/${name}")
    elseif(NOT EXISTS "${PLATFORM_DIR}/${name}")
      continue()
    endif()
    require_public("${name}" "${header}")
  endforeach()
endforeach()

if(problems)
  list(JOIN problems "\n  " text)
  message(FATAL_ERROR "Platform headers outside the public list:\n  ${text}")
endif()
list(LENGTH public_headers count)
message(STATUS "The provider includes only the ${count} public platform headers")
