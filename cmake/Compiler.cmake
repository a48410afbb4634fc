# Flags for every target. Single precision arithmetic is part of what the pen promises: nothing may fuse or
# reorder it, on any processor. That a root of a negative number sets errno, and that a comparison raises a flag, nobody
# asks: without it a root is one instruction, and a choice between two floats needs no branch. No result differs.
add_compile_options(-ffp-contract=off -fno-math-errno -fno-trapping-math -Wall -Wextra -Wshadow -Wnon-virtual-dtor -Werror=missing-field-initializers
                    -Werror=return-type)
if(CMAKE_UNITY_BUILD)
  # Several sources as one look to GCC like one header's; then it warns of types that only one source knows.
  add_compile_options(-Wno-subobject-linkage)
endif()
if(QELT_WERROR)
  add_compile_options(-Werror)
endif()
if(QELT_SANITIZE)
  add_compile_options(-fsanitize=${QELT_SANITIZE} -fno-omit-frame-pointer -g1)
  if(QELT_SANITIZE MATCHES "undefined")
    add_compile_options(-fno-sanitize-recover=undefined)
  endif()
  add_link_options(-fsanitize=${QELT_SANITIZE})
elseif(NOT EMSCRIPTEN)
  # A call from one library to another jumps to the address itself, not by way of a stub: the pen makes one for each
  # stamp's place.
  add_compile_options(-fno-plt)
  add_link_options(LINKER:--no-undefined)
endif()
if(NOT EMSCRIPTEN)
  # Names a library's or program's debugging information, which is installed apart from it.
  add_link_options(LINKER:--build-id=sha1)
endif()
find_program(QELT_CCACHE ccache)
if(QELT_CCACHE)
  # Else it keeps nothing that uses a precompiled header.
  set(CMAKE_CXX_COMPILER_LAUNCHER
    ${CMAKE_COMMAND} -E env CCACHE_SLOPPINESS=pch_defines,time_macros ${QELT_CCACHE})
endif()
