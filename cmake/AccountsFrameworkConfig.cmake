# What find_package(AccountsFramework) gives:
#   accounts::framework       the headers, the values and the vocabulary that a framework needs
#   add_accounts_framework()  builds a framework
#   accounts::store           what opens the store of a device root, for a program of one's own
#   AccountsFramework_BUNDLE  the plug-in's bundle, whose Resources/AccountCreators.plist is the
#                             account-creation map
include(CMakeFindDependencyMacro)
find_dependency(EXPAT)
find_dependency(PkgConfig)
pkg_check_modules(UUID REQUIRED QUIET IMPORTED_TARGET uuid)
pkg_check_modules(SECCOMP REQUIRED QUIET IMPORTED_TARGET libseccomp)
include(${CMAKE_CURRENT_LIST_DIR}/AccountsFrameworkTargets.cmake)
include(${CMAKE_CURRENT_LIST_DIR}/AccountsFrameworks.cmake)
cmake_path(SET AccountsFramework_BUNDLE NORMALIZE
  ${CMAKE_CURRENT_LIST_DIR}/../../accounts/accounts.migrator)
