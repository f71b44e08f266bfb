# Read by cpack before it packs. A package that unpacks under one prefix while its
# library looks for the colour scheme under another only works with VENLOMER_DATA_PATH
# set, which no user of an installed package should need; so such a package is never made.
if(NOT CPACK_VENLOMER_CONFIGURED_PREFIX STREQUAL CPACK_PACKAGING_INSTALL_PREFIX)
  message(FATAL_ERROR
    "this build tree is configured for the prefix ${CPACK_VENLOMER_CONFIGURED_PREFIX}, but the "
    "package installs under ${CPACK_PACKAGING_INSTALL_PREFIX}, where its library would not find "
    "its data: make the package with `cmake --workflow --preset package`")
endif()
