# What building for a browser takes that other systems bring along.

# The page is one file that is mailed and opened: what draws stays fast, all else is kept small.
set(CMAKE_POSITION_INDEPENDENT_CODE OFF)
set(CMAKE_CXX_FLAGS_RELEASE "-Os -DNDEBUG")
set(CMAKE_C_FLAGS_RELEASE "-Os -DNDEBUG")

# C++ exceptions, as browsers have them themselves.
add_compile_options(-fwasm-exceptions)
add_link_options(-fwasm-exceptions)

# Its optimiser is a script that needs Debian's libraries, whichever node runs it.
set(CMAKE_CXX_LINKER_LAUNCHER ${CMAKE_COMMAND} -E env NODE_PATH=/usr/share/nodejs)

# Emscripten brings no XML parser. Debian's source package of expat, as tools/install-packages --web unpacks it.
set(QELT_EXPAT_SOURCE "" CACHE PATH "Where expat's source package is unpacked")
set(expat ${QELT_EXPAT_SOURCE}/expat)
if(NOT EXISTS ${expat}/lib/xmlparse.c)
  set(expat ${QELT_EXPAT_SOURCE})
endif()
if(NOT EXISTS ${expat}/lib/xmlparse.c)
  message(FATAL_ERROR "There is no source of expat in \"${QELT_EXPAT_SOURCE}\": run tools/install-packages --web.")
endif()
enable_language(C)
add_library(expat STATIC ${expat}/lib/xmlparse.c ${expat}/lib/xmltok.c ${expat}/lib/xmlrole.c)
# Entropy only salts a hash table against files made to slow it down, and these slow but their own page.
file(CONFIGURE OUTPUT ${CMAKE_BINARY_DIR}/expat/expat_config.h CONTENT [[
#define XML_DTD 1
#define XML_NS 1
#define XML_GE 1
#define XML_CONTEXT_BYTES 1024
#define XML_POOR_ENTROPY 1
#define HAVE_MEMMOVE 1
#define BYTEORDER 1234
]])
target_include_directories(expat PRIVATE ${CMAKE_BINARY_DIR}/expat)
target_compile_options(expat PRIVATE -w)
target_include_directories(expat SYSTEM PUBLIC ${expat}/lib)
add_library(EXPAT::EXPAT ALIAS expat)
