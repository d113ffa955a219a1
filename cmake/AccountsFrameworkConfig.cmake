# What find_package(AccountsFramework) gives: the target accounts::framework, which has the headers
# and the values that a framework needs, and the function add_accounts_framework.
include(${CMAKE_CURRENT_LIST_DIR}/AccountsFrameworkTargets.cmake)
include(${CMAKE_CURRENT_LIST_DIR}/AccountsFrameworks.cmake)
