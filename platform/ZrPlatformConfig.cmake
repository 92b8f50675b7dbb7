# What the static libraries of the platform are linked with.
include(CMakeFindDependencyMacro)
find_dependency(PkgConfig)
pkg_check_modules(MNL REQUIRED IMPORTED_TARGET libmnl)
include(${CMAKE_CURRENT_LIST_DIR}/ZrPlatformTargets.cmake)
