# What the Windows build puts in place of the build machine's packages: GLEW compiled from
# Debian's source package, opengl32, the header-only libraries of the build machine, GoogleTest
# from its Debian source, and a runtime linked statically so the programs and the module need
# nothing beyond Windows' own DLLs.

# Programs the build or CTest starts (test discovery, the tests) run under wine, with the
# prefix inside the build folder.
set(CMAKE_CROSSCOMPILING_EMULATOR ${CMAKE_SOURCE_DIR}/scripts/wine-run --prefix ${CMAKE_BINARY_DIR}/wine)

# libgcc, libstdc++ and winpthread go into every binary; system DLLs stay imports.
add_link_options(-static)
add_compile_definitions(WIN32_LEAN_AND_MEAN NOMINMAX)

set(VELTRANE_GLEW_SOURCE_DIR "" CACHE PATH "Unpacked source of Debian's glew package")
if(NOT EXISTS "${VELTRANE_GLEW_SOURCE_DIR}/src/glew.c")
  message(FATAL_ERROR "VELTRANE_GLEW_SOURCE_DIR: expected an unpacked glew source with src/glew.c, "
                      "got '${VELTRANE_GLEW_SOURCE_DIR}' (scripts/build-windows fetches it)")
endif()

add_library(veltrane_opengl INTERFACE)
target_link_libraries(veltrane_opengl INTERFACE opengl32)
add_library(OpenGL::OpenGL ALIAS veltrane_opengl)

add_library(veltrane_glew STATIC ${VELTRANE_GLEW_SOURCE_DIR}/src/glew.c)
target_compile_definitions(veltrane_glew PUBLIC GLEW_STATIC GLEW_NO_GLU)
target_include_directories(veltrane_glew SYSTEM PUBLIC ${VELTRANE_GLEW_SOURCE_DIR}/include)
target_compile_options(veltrane_glew PRIVATE -w)  # third-party source, built as it comes
target_link_libraries(veltrane_glew PUBLIC veltrane_opengl)
add_library(GLEW::GLEW ALIAS veltrane_glew)

# Header-only libraries of the build machine, reached through a folder that holds only them:
# putting /usr/include itself on the path would hand the cross compiler glibc's headers.
set(host_headers ${CMAKE_BINARY_DIR}/host-headers)
file(MAKE_DIRECTORY ${host_headers})
foreach(folder nlohmann stb CLI)
  if(EXISTS /usr/include/${folder})
    file(CREATE_LINK /usr/include/${folder} ${host_headers}/${folder} SYMBOLIC)
  endif()
endforeach()

# Package configs for the find_package calls of the tree: the header-only ones name the mirrored
# headers; GoogleTest's only confirms the targets built below.
function(veltrane_package_config package version)
  set(dir ${CMAKE_BINARY_DIR}/host-packages/${package})
  string(JOIN "" body ${ARGN})
  file(WRITE ${dir}/${package}Config.cmake "${body}")
  file(WRITE ${dir}/${package}ConfigVersion.cmake
       "set(PACKAGE_VERSION ${version})\nset(PACKAGE_VERSION_COMPATIBLE TRUE)\n")
  set(${package}_DIR ${dir} CACHE PATH "" FORCE)
endfunction()
function(veltrane_header_package package target version)
  veltrane_package_config(${package} ${version}
    "if(NOT TARGET ${target})\n"
    "  add_library(${target} INTERFACE IMPORTED)\n"
    "  set_target_properties(${target} PROPERTIES INTERFACE_INCLUDE_DIRECTORIES ${host_headers})\n"
    "endif()\n")
endfunction()
veltrane_header_package(nlohmann_json nlohmann_json::nlohmann_json 3.11.2)
veltrane_header_package(CLI11 CLI11::CLI11 2.3.2)

add_library(veltrane_stb INTERFACE)
target_include_directories(veltrane_stb SYSTEM INTERFACE ${host_headers})

if(VELTRANE_TESTS)
  # Debian's googletest source, built for the target like the rest of the tree.
  set(INSTALL_GTEST OFF CACHE BOOL "" FORCE)
  # Its own CMake names the targets GTest::gtest, GTest::gmock and their _main companions.
  add_subdirectory(/usr/src/googletest ${CMAKE_BINARY_DIR}/googletest EXCLUDE_FROM_ALL SYSTEM)
  veltrane_package_config(GTest 1.12.1 "")
endif()
