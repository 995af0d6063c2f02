# The two Debian packages; `cpack` in the build folder writes them.

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_DIRECTORY ${PROJECT_BINARY_DIR}/packages)
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_VERBATIM_VARIABLES ON)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
set(CPACK_COMPONENTS_ALL program)
if(KESTROVA_TOOLS)
    list(APPEND CPACK_COMPONENTS_ALL tools)
endif()

set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_MAINTAINER "${KESTROVA_MAINTAINER}")
set(CPACK_DEBIAN_PACKAGE_RELEASE ${package_release})
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)

# Essential packages may be named only with a version: it is the one that was tested with.
set(shell_utilities
    "coreutils (>= 9.1), dash (>= 0.5.12), grep (>= 3.8), hostname (>= 3.23), sed (>= 4.9)")

set(CPACK_DEBIAN_PROGRAM_PACKAGE_NAME kestrova-panel)
set(CPACK_DEBIAN_PROGRAM_PACKAGE_SECTION admin)
# What the program runs through the shell: stty, cat, head, sort, tr, env from coreutils; ifconfig
# from net-tools; ps, and the service's kill, from procps.
set(CPACK_DEBIAN_PROGRAM_PACKAGE_DEPENDS
    "${shell_utilities}, mawk | gawk, net-tools, procps")
set(CPACK_DEBIAN_PROGRAM_PACKAGE_SUGGESTS kestrova-panel-tools)
set(CPACK_DEBIAN_PROGRAM_PACKAGE_CONTROL_EXTRA
    ${CMAKE_CURRENT_SOURCE_DIR}/debian/postinst
    ${CMAKE_CURRENT_SOURCE_DIR}/debian/prerm
    ${CMAKE_CURRENT_SOURCE_DIR}/debian/postrm)
set(CPACK_COMPONENT_PROGRAM_DESCRIPTION "front panel of a rack-mounted monitoring appliance
Shows the appliance's state on the front's display of two rows by 16
characters, and lets an operator at the rack set network ports and host
name with its four keys. The panel is an EZIO module on /dev/ttyS1.

Changes are made by the appliance's own configuration script, which is not
part of this package.")

set(CPACK_DEBIAN_TOOLS_PACKAGE_NAME kestrova-panel-tools)
set(CPACK_DEBIAN_TOOLS_PACKAGE_SECTION devel)
set(CPACK_DEBIAN_TOOLS_PACKAGE_DEPENDS
    "${shell_utilities}, bubblewrap, iproute2, net-tools, python3, sysvinit-utils (>= 3.06), udhcpc, udhcpd, util-linux (>= 2.38)")
set(CPACK_DEBIAN_TOOLS_PACKAGE_RECOMMENDS kestrova-panel)
set(CPACK_COMPONENT_TOOLS_DESCRIPTION "emulated front panel and appliance for kestrova-panel
The panel as a pseudo-terminal, shown on the terminal or played by a
journey of keys and expectations; a sandbox in which kestrova-panel finds
the ports, files and configuration script of an appliance; and journeys
through all its screens.")

include(CPack)
