# What the static libraries of the platform are linked with.
include(CMakeFindDependencyMacro)
find_dependency(PkgConfig)
pkg_check_modules(MNL REQUIRED IMPORTED_TARGET libmnl)
pkg_check_modules(SYSTEMD REQUIRED IMPORTED_TARGET libsystemd)
include(${CMAKE_CURRENT_LIST_DIR}/ZrPlatformTargets.cmake)
