# What is installed, and where. The prefix may be given only when it is installed (cmake --install --prefix), so files that
# contain paths are made then.

set(ZORVA_UNIT_DIR lib/systemd/system CACHE STRING "Directory of the units of systemd, in the prefix or absolute")

# The places that do not depend on the prefix go into the script that computes all of them.
set(ZORVA_INSTALL_PLACES ${CMAKE_BINARY_DIR}/InstallPlaces.cmake)
configure_file(${CMAKE_SOURCE_DIR}/cmake/InstallPlaces.cmake.in ${ZORVA_INSTALL_PLACES} @ONLY)

# zorva_install_library(TARGET): installs a shared library, which finds the other libraries in its own directory.
function(zorva_install_library target)
  set_target_properties(${target} PROPERTIES INSTALL_RPATH "$ORIGIN")
  install(TARGETS ${target} LIBRARY NAMELINK_SKIP)
endfunction()

# zorva_install_provider(TARGET): also with a link under the name that other CIM servers look for, without a version.
function(zorva_install_provider target)
  zorva_install_library(${target})
  set(link ${CMAKE_BINARY_DIR}/cmpi/lib${target}.so)
  file(MAKE_DIRECTORY ${CMAKE_BINARY_DIR}/cmpi)
  file(CREATE_LINK ../lib${target}.so.1 ${link} SYMBOLIC)
  install(FILES ${link} DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmpi)
endfunction()

# zorva_install_configured(TEMPLATE DESTINATION): installs TEMPLATE, a path that ends in ".in", without this ending and with
# the places that InstallPlaces.cmake.in names. DESTINATION is in the prefix or absolute.
function(zorva_install_configured template destination)
  get_filename_component(name ${template} NAME_WLE)
  set(made ${CMAKE_BINARY_DIR}/installed/${destination}/${name})
  install(CODE "
    include(\"${ZORVA_INSTALL_PLACES}\")
    configure_file(\"${template}\" \"${made}\" @ONLY)
    zorva_in_prefix(folder \"${destination}\")
    file(INSTALL \"${made}\" DESTINATION \"\${folder}\")")
endfunction()

# zorva_install_units(NAME...): units of systemd.
function(zorva_install_units)
  foreach(name ${ARGN})
    zorva_install_configured(${CMAKE_SOURCE_DIR}/packaging/systemd/${name}.in ${ZORVA_UNIT_DIR})
  endforeach()
endfunction()

# zorva_install_config(FILE): installs a configuration. One that a person has changed stays.
function(zorva_install_config file)
  get_filename_component(name ${file} NAME)
  set_property(GLOBAL APPEND PROPERTY ZORVA_CONFIGS ${file})
  install(CODE "
    include(\"${ZORVA_INSTALL_PLACES}\")
    zorva_is_changed(changed \"\$ENV{DESTDIR}\${ZORVA_CONFIG_DIR}/${name}\" \"${file}\")
    if(changed)
      message(STATUS \"Kept, because it was changed: \${ZORVA_CONFIG_DIR}/${name}\")
      list(APPEND CMAKE_INSTALL_MANIFEST_FILES \"\${ZORVA_CONFIG_DIR}/${name}\")
    else()
      file(INSTALL \"${file}\" DESTINATION \"\${ZORVA_CONFIG_DIR}\")
    endif()")
endfunction()

# zorva_add_uninstall(): the target "uninstall". Called when all configurations are known.
function(zorva_add_uninstall)
  get_property(configs GLOBAL PROPERTY ZORVA_CONFIGS)
  add_custom_target(uninstall
    COMMAND ${CMAKE_COMMAND} "-DPLACES=${ZORVA_INSTALL_PLACES}" "-DBUILD=${CMAKE_BINARY_DIR}" "-DCONFIGS=${configs}"
            -P ${CMAKE_SOURCE_DIR}/cmake/Uninstall.cmake
    VERBATIM)
endfunction()

foreach(kind sysusers tmpfiles)
  zorva_install_configured(${CMAKE_SOURCE_DIR}/packaging/systemd/${kind}/zorva.conf.in lib/${kind}.d)
endforeach()

# For those who write providers.
file(GLOB headers CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/agent/interface/*.h)
install(FILES ${headers} DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/zorvagent)
file(GLOB headers CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/cmpi/*.h)
install(FILES ${headers} DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/zorvagent/cmpi)
zorva_install_configured(${CMAKE_SOURCE_DIR}/packaging/developers/zorvagent.pc.in ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
zorva_install_configured(${CMAKE_SOURCE_DIR}/packaging/developers/zorvagent-config.cmake.in
  ${CMAKE_INSTALL_LIBDIR}/cmake/zorvagent)
include(CMakePackageConfigHelpers)
write_basic_package_version_file(${CMAKE_BINARY_DIR}/zorvagent-config-version.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_BINARY_DIR}/zorvagent-config-version.cmake DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/zorvagent)
install(DIRECTORY ${CMAKE_SOURCE_DIR}/examples/provider DESTINATION ${CMAKE_INSTALL_DOCDIR}/examples)
