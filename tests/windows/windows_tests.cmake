# The Windows build's suites: the integration tests and the Windows-only ones run under wine;
# the DLL's tables are read on the build machine; the demo frame is compared with the Linux
# build's (VELTRANE_LINUX_BUILD_DIR) within 1/255 per channel.
set(VELTRANE_LINUX_BUILD_DIR ${CMAKE_SOURCE_DIR}/build CACHE PATH "The Linux build to compare with")
set(scene ${CMAKE_SOURCE_DIR}/docs/examples/demo.json)
set(frames ${CMAKE_BINARY_DIR}/demo-frames)
file(MAKE_DIRECTORY ${frames})

file(GLOB integration_sources CONFIGURE_DEPENDS ${CMAKE_CURRENT_SOURCE_DIR}/integration/*.cpp)
# The draw-path test steers the plug-in through the GL string overrides, Linux only.
list(FILTER integration_sources EXCLUDE REGEX "mesh_draw_path_test\\.cpp$")
veltrane_test_executable(integration ${integration_sources})
file(GLOB windows_sources CONFIGURE_DEPENDS ${CMAKE_CURRENT_SOURCE_DIR}/windows/*_test.cpp)
list(FILTER windows_sources EXCLUDE REGEX "demo_frame_test\\.cpp$")
veltrane_test_executable(windows ${windows_sources})
# The comparison runs after both renders, in a program of its own so the others need neither.
set(VELTRANE_TEST_PROPERTIES FIXTURES_REQUIRED demo_frames)
veltrane_test_executable(demo_frame ${CMAKE_CURRENT_SOURCE_DIR}/windows/demo_frame_test.cpp)
target_compile_definitions(test_demo_frame PRIVATE VELTRANE_DEMO_FRAMES_DIR="${frames}")

add_test(NAME WindowsModule.ExportsAndImports COMMAND ${CMAKE_COMMAND}
         -DMODULE=$<TARGET_FILE:veltrane> -P ${CMAKE_CURRENT_SOURCE_DIR}/windows/module_tables.cmake)
add_test(NAME DemoFrame.LinuxRender COMMAND ${VELTRANE_LINUX_BUILD_DIR}/bin/veltrane render -y
         ${scene} -o ${frames}/linux.png --frame 40)
add_test(NAME DemoFrame.WindowsRender COMMAND veltrane_cli render -y ${scene}
         -o ${frames}/windows.png --frame 40 --plugin $<TARGET_FILE:veltrane>)
set_tests_properties(DemoFrame.LinuxRender DemoFrame.WindowsRender PROPERTIES
                     FIXTURES_SETUP demo_frames LABELS demo_frame)
set_tests_properties(WindowsModule.ExportsAndImports PROPERTIES LABELS windows)
