# Compiles the locales the locale test runs under into OUT, one directory per
# locale, for use through LOCPATH. Locales already made are kept. A locale that
# cannot be made fails this step, and with it the tests that need it.
#   cmake -DLOCALEDEF=<path> -DOUT=<dir> -P make_locales.cmake
if(NOT LOCALEDEF)
  message(FATAL_ERROR "localedef was not found; it comes with the C library's locale sources")
endif()
file(MAKE_DIRECTORY ${OUT})
foreach(locale tr_TR.UTF-8 tr_TR.ISO-8859-9 de_DE.UTF-8)
  if(EXISTS ${OUT}/${locale}/LC_CTYPE)
    continue()
  endif()
  string(REPLACE "." ";" parts ${locale})
  list(GET parts 0 source)
  list(GET parts 1 charmap)
  # localedef exits with 1 for warnings it still writes the locale for; the
  # files it leaves behind decide.
  execute_process(COMMAND ${LOCALEDEF} -i ${source} -f ${charmap} ${OUT}/${locale}
    RESULT_VARIABLE result OUTPUT_VARIABLE output ERROR_VARIABLE output)
  if(NOT EXISTS ${OUT}/${locale}/LC_CTYPE)
    message(FATAL_ERROR "localedef could not make ${locale} (exit ${result}):\n${output}")
  endif()
endforeach()
