# Runs in cpack, before the packages are packed: the documents that Debian wants in each, and its form of them.

# The libraries of a cross compiler tell in their own way which of the target's packages they stand for.
file(GLOB cross_libraries /var/lib/dpkg/info/*-${CPACK_DEBIAN_PACKAGE_ARCHITECTURE}-cross.shlibs)
set(shlibs "")
foreach(file IN LISTS cross_libraries)
  file(READ ${file} lines)
  string(REPLACE ":${CPACK_DEBIAN_PACKAGE_ARCHITECTURE}" "" lines "${lines}")
  string(APPEND shlibs "${lines}")
endforeach()

file(GLOB folders ${CPACK_TEMPORARY_INSTALL_DIRECTORY}/*)
foreach(folder IN LISTS folders)
  get_filename_component(component ${folder} NAME)
  string(TOUPPER ${component} component)
  set(name ${CPACK_DEBIAN_${component}_PACKAGE_NAME})
  set(documents ${folder}/usr/share/doc/${name})
  file(COPY ${CPACK_KIV_DOCUMENTS}/changelog ${CPACK_KIV_DOCUMENTS}/copyright DESTINATION ${documents}
       FILE_PERMISSIONS OWNER_READ OWNER_WRITE GROUP_READ WORLD_READ)
  if(CPACK_KIV_CROSS AND NOT component STREQUAL HEADERS)
    file(WRITE ${folder}/debian/shlibs.local "${shlibs}") # gone again once the dependencies are known
  endif()
  if(EXISTS ${CPACK_KIV_DOCUMENTS}/${name}.lintian-overrides)
    configure_file(${CPACK_KIV_DOCUMENTS}/${name}.lintian-overrides ${folder}/usr/share/lintian/overrides/${name} COPYONLY)
  endif()
  file(GLOB compressed ${documents}/changelog ${folder}/usr/share/man/*/*)
  execute_process(COMMAND gzip -9n ${compressed} COMMAND_ERROR_IS_FATAL ANY)
endforeach()
