# vantrel.dll for 32-bit Windows: the fourteen exports under their plain names and the
# ordinals of src/interface/vantrel.def, the identity profiles embedded as "ICCPROFILE"
# resources 102..105, and the C++ runtime linked in so that the DLL needs only system DLLs.

enable_language(RC)

# The profile writer runs on the build machine, so it is built with the native compiler.
include(ExternalProject)
set(VANTREL_HOST_TOOLS_DIR ${CMAKE_BINARY_DIR}/host-tools)
set(VANTREL_PROFILE_WRITER ${VANTREL_HOST_TOOLS_DIR}/vantrel_profile_writer${CMAKE_HOST_EXECUTABLE_SUFFIX})
ExternalProject_Add(vantrel_host_tools
  SOURCE_DIR ${CMAKE_SOURCE_DIR}/tools/host
  BINARY_DIR ${VANTREL_HOST_TOOLS_DIR}
  CMAKE_ARGS -DCMAKE_BUILD_TYPE=Release -DVANTREL_SOURCE_DIR=${CMAKE_SOURCE_DIR}
  INSTALL_COMMAND ""
  BUILD_ALWAYS ON
  BUILD_BYPRODUCTS ${VANTREL_PROFILE_WRITER})

set(VANTREL_RESOURCE_DIR ${CMAKE_BINARY_DIR}/resources)
set(VANTREL_RESOURCE_SCRIPT ${VANTREL_RESOURCE_DIR}/identity_profiles.rc)
set(VANTREL_RESOURCE_FILES
  ${VANTREL_RESOURCE_DIR}/neutral.3cc
  ${VANTREL_RESOURCE_DIR}/cmyk2cmyk5neutral.mcc
  ${VANTREL_RESOURCE_DIR}/cmykog2cmykog5neutral.mcc
  ${VANTREL_RESOURCE_DIR}/cmykrgb2cmykrgb5neutral.mcc)
add_custom_command(
  OUTPUT ${VANTREL_RESOURCE_SCRIPT} ${VANTREL_RESOURCE_FILES}
  COMMAND ${CMAKE_COMMAND} -E make_directory ${VANTREL_RESOURCE_DIR}
  COMMAND ${VANTREL_PROFILE_WRITER} ${VANTREL_RESOURCE_DIR}
  DEPENDS vantrel_host_tools ${VANTREL_PROFILE_WRITER}
  COMMENT "Writing the identity profiles and their resource script"
  VERBATIM)
set_source_files_properties(${VANTREL_RESOURCE_SCRIPT} PROPERTIES
  GENERATED ON
  OBJECT_DEPENDS "${VANTREL_RESOURCE_FILES}")

target_sources(vantrel PRIVATE ${CMAKE_SOURCE_DIR}/src/interface/vantrel.def ${VANTREL_RESOURCE_SCRIPT})
set_target_properties(vantrel PROPERTIES PREFIX "" OUTPUT_NAME vantrel)
target_link_options(vantrel PRIVATE -static -static-libgcc -static-libstdc++ -Wl,--no-undefined
  $<$<CONFIG:Release>:-s>)

# The 32-bit host: it loads vantrel.dll at run time and checks it against the Linux build.
add_executable(vantrel_win32_host
  ${CMAKE_SOURCE_DIR}/tests/win32/win32_host.c
  ${CMAKE_SOURCE_DIR}/tests/win32/scenario.c)
target_include_directories(vantrel_win32_host PRIVATE ${CMAKE_SOURCE_DIR}/include)
# Hosts built by other compilers keep the stack aligned to 4 bytes only; so does this one.
target_compile_options(vantrel_win32_host PRIVATE -mpreferred-stack-boundary=2)
target_link_options(vantrel_win32_host PRIVATE -static)
set_target_properties(vantrel_win32_host PROPERTIES RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR})
add_dependencies(vantrel_win32_host vantrel)

# The platform layer on its own: regional settings and fixed paths.
add_executable(vantrel_win32_platform_check ${CMAKE_SOURCE_DIR}/tests/win32/platform_check.cpp)
target_link_libraries(vantrel_win32_platform_check PRIVATE vantrel_core)
target_link_options(vantrel_win32_platform_check PRIVATE -static)
set_target_properties(vantrel_win32_platform_check PROPERTIES RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR})
