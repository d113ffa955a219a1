# What is installed, by `cmake --install` and in the Debian packages: the programs with all that they
# need beside them, and what the author of a framework needs to compile against.
include(CMakePackageConfigHelpers)
include(GNUInstallDirs)

set(programs_component accounts-migration)
set(development_component accounts-migration-dev)

# The programs look for the bundle here (commandline/BundleLocation).
set(library_directory lib/accounts)

install(TARGETS migration-host accountsctl
  RUNTIME DESTINATION bin COMPONENT ${programs_component})
install(TARGETS AccountsDataMigrator
  LIBRARY DESTINATION ${library_directory}/accounts.migrator COMPONENT ${programs_component})
install(DIRECTORY ${PROJECT_SOURCE_DIR}/resources/
  DESTINATION ${library_directory}/accounts.migrator/Resources COMPONENT ${programs_component})
install(FILES ${PROJECT_SOURCE_DIR}/README.md ${PROJECT_SOURCE_DIR}/CHANGELOG.md
  ${PROJECT_SOURCE_DIR}/CONTRIBUTING.md
  DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/doc/accounts-migration COMPONENT ${programs_component})
install(DIRECTORY ${PROJECT_SOURCE_DIR}/docs
  DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/doc/accounts-migration COMPONENT ${programs_component}
  FILES_MATCHING PATTERN "*.md" PATTERN "*.png" PATTERN "schema/*.json")

# Parts of these libraries are in the programs; their licences ask for these notices then.
foreach(library libcli11-dev libexpected-dev libfmt-dev nlohmann-json3-dev)
  install(FILES /usr/share/doc/${library}/copyright RENAME ${library}
    DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/doc/accounts-migration/licences
    COMPONENT ${programs_component})
endforeach()

# The sample device, and the commands of ./demo that work without a build.
install(DIRECTORY ${PROJECT_SOURCE_DIR}/examples/fleet ${PROJECT_SOURCE_DIR}/examples/sample-device
  DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/doc/accounts-migration/examples
  COMPONENT ${programs_component} USE_SOURCE_PERMISSIONS)
install(PROGRAMS ${PROJECT_SOURCE_DIR}/examples/complete-device-root ${PROJECT_SOURCE_DIR}/examples/show-accounts
  DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/doc/accounts-migration/examples COMPONENT ${programs_component})
install(FILES ${PROJECT_SOURCE_DIR}/examples/README.md
  DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/doc/accounts-migration/examples COMPONENT ${programs_component})

# Manual pages and the packages' changelog are compressed, as Debian wants them.
set(compressed_directory ${PROJECT_BINARY_DIR}/compressed)
file(MAKE_DIRECTORY ${compressed_directory})
function(compress file)
  cmake_path(GET file FILENAME name)
  execute_process(COMMAND gzip -9nc ${file} OUTPUT_FILE ${compressed_directory}/${name}.gz
    COMMAND_ERROR_IS_FATAL ANY)
  set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${file})
endfunction()
foreach(page migration-host.1 accountsctl.1)
  compress(${PROJECT_SOURCE_DIR}/docs/man/${page})
  install(FILES ${compressed_directory}/${page}.gz
    DESTINATION ${CMAKE_INSTALL_MANDIR}/man1 COMPONENT ${programs_component})
endforeach()
set(CPACK_PACKAGE_CONTACT "Accounts Migration <accounts-migration@quarx.example>")
file(TIMESTAMP ${PROJECT_SOURCE_DIR}/CHANGELOG.md changelog_date "%a, %d %b %Y %H:%M:%S +0000" UTC)
configure_file(${CMAKE_CURRENT_LIST_DIR}/changelog.in ${compressed_directory}/changelog @ONLY)
compress(${compressed_directory}/changelog)
foreach(component ${programs_component} ${development_component})
  install(FILES ${compressed_directory}/changelog.gz
    DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/doc/${component} COMPONENT ${component})
endforeach()
install(FILES ${PROJECT_SOURCE_DIR}/completion/migration-host ${PROJECT_SOURCE_DIR}/completion/accountsctl
  DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/bash-completion/completions COMPONENT ${programs_component})

set(package_directory lib/cmake/AccountsFramework)
install(TARGETS vocabulary propertyvalue propertylistcodecs accountsettings linuxplatform
    accountsframework accountsstore
  EXPORT AccountsFrameworkTargets
  ARCHIVE DESTINATION ${library_directory} COMPONENT ${development_component})
install(EXPORT AccountsFrameworkTargets NAMESPACE accounts::
  DESTINATION ${package_directory} COMPONENT ${development_component})
foreach(folder vocabulary propertylist platform accountsettings)
  install(DIRECTORY ${PROJECT_SOURCE_DIR}/${folder}
    DESTINATION include/accounts COMPONENT ${development_component} FILES_MATCHING PATTERN "*.h")
endforeach()
write_basic_package_version_file(${PROJECT_BINARY_DIR}/AccountsFrameworkConfigVersion.cmake
  COMPATIBILITY SameMinorVersion)
install(FILES
    ${CMAKE_CURRENT_LIST_DIR}/AccountsFrameworkConfig.cmake
    ${CMAKE_CURRENT_LIST_DIR}/AccountsFrameworks.cmake
    ${CMAKE_CURRENT_LIST_DIR}/AccountsFrameworks.map
    ${PROJECT_BINARY_DIR}/AccountsFrameworkConfigVersion.cmake
  DESTINATION ${package_directory} COMPONENT ${development_component})
install(DIRECTORY ${PROJECT_SOURCE_DIR}/examples/frameworks ${PROJECT_SOURCE_DIR}/examples/notify
  DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/doc/accounts-migration-dev/examples
  COMPONENT ${development_component})

# Two Debian packages, one a component.
set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_DIRECTORY ${PROJECT_BINARY_DIR}/packages)
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_PRE_BUILD_SCRIPTS ${PROJECT_SOURCE_DIR}/cmake/ReadableDirectories.cmake)
set(CPACK_COMPONENTS_ALL ${programs_component} ${development_component})
set(CPACK_COMPONENTS_GROUPING IGNORE)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_ACCOUNTS-MIGRATION_PACKAGE_NAME accounts-migration)
set(CPACK_DEBIAN_ACCOUNTS-MIGRATION_PACKAGE_SECTION admin)
set(CPACK_DEBIAN_ACCOUNTS-MIGRATION_PACKAGE_SHLIBDEPS ON)
# Loaded only when the journal or D-Bus is asked for.
set(CPACK_DEBIAN_ACCOUNTS-MIGRATION_PACKAGE_SUGGESTS "libsystemd0, parallel")
set(CPACK_COMPONENT_ACCOUNTS-MIGRATION_DESCRIPTION
  "Migration of the account settings of mobile devices
Brings the account settings of a device, or of an image of one, up to the
current layout after its operating system was updated or restored:
migration-host runs the migration, accountsctl shows, compares and checks
files.")
set(CPACK_DEBIAN_ACCOUNTS-MIGRATION-DEV_PACKAGE_NAME accounts-migration-dev)
set(CPACK_DEBIAN_ACCOUNTS-MIGRATION-DEV_PACKAGE_SECTION libdevel)
# The bundle with the account-creation map, what checks a framework, and what the store is built on.
set(CPACK_DEBIAN_ACCOUNTS-MIGRATION-DEV_PACKAGE_DEPENDS
  "accounts-migration (= ${PROJECT_VERSION}), libexpat1-dev, libexpected-dev, libseccomp-dev, uuid-dev, pkgconf")
set(CPACK_DEBIAN_ACCOUNTS-MIGRATION-DEV_PACKAGE_SUGGESTS "cmake")
set(CPACK_COMPONENT_ACCOUNTS-MIGRATION-DEV_DESCRIPTION
  "Development files for frameworks of accounts
The headers, the libraries and the CMake package that a framework of full
accounts, sync accounts and notifiers is compiled against, or a program that
opens the store of a device, and examples of both.")
include(CPack)
