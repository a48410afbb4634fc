# qelt_log: the Android log library, as Debian packages it.
if(NOT TARGET qelt_log)
  find_library(QELT_LOG_LIBRARY NAMES log PATH_SUFFIXES android REQUIRED)
  find_path(QELT_LOG_INCLUDE android/log.h PATH_SUFFIXES android REQUIRED)
  add_library(qelt_log INTERFACE)
  target_include_directories(qelt_log SYSTEM INTERFACE ${QELT_LOG_INCLUDE})
  target_link_libraries(qelt_log INTERFACE ${QELT_LOG_LIBRARY})
endif()
