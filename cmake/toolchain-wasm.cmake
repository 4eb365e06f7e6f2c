# WebAssembly with SIMD128, through Debian's emscripten. The results run under node (the tests)
# and in browsers (the web editor, web/).
#
# Debian's emscripten needs node's modules on NODE_PATH when it links (the wasm preset sets it),
# and node 20 must be told not to use fetch() for the .wasm beside a script it runs from disk.
# The test runner emscripten's platform file would pick runs node with a flag node 20 refuses,
# so the emulator is set here, before the platform file looks for one.
set(PHOTOFX_EMSCRIPTEN_ROOT /usr/share/emscripten CACHE PATH "emscripten's installation")
find_program(PHOTOFX_NODE node REQUIRED)
set(CMAKE_CROSSCOMPILING_EMULATOR ${PHOTOFX_NODE} --no-experimental-fetch
    CACHE STRING "runs the wasm tests")
include(${PHOTOFX_EMSCRIPTEN_ROOT}/cmake/Modules/Platform/Emscripten.cmake)

set(CMAKE_C_FLAGS_INIT "-msimd128")
set(CMAKE_CXX_FLAGS_INIT "-msimd128")
