# Run by CPack on the staged files: moves the module of an rpm for 64 bits below lib64.
if(CPACK_GENERATOR STREQUAL "RPM")
  set(prefix ${CPACK_TEMPORARY_DIRECTORY}${CPACK_PACKAGING_INSTALL_PREFIX})
  if(EXISTS ${prefix}/lib/cmpi)
    file(MAKE_DIRECTORY ${prefix}/lib64)
    file(RENAME ${prefix}/lib/cmpi ${prefix}/lib64/cmpi)
  endif()
endif()
