# Warning and sanitizer flags shared by every target of the project.
add_library(tsd_compile_options INTERFACE)
target_compile_options(tsd_compile_options INTERFACE -Wall -Wextra)
if(TSD_WARNINGS_AS_ERRORS)
  target_compile_options(tsd_compile_options INTERFACE -Werror)
endif()
if(TSD_SANITIZE)
  set(_tsd_san -fsanitize=address,undefined -fno-sanitize-recover=all -fno-omit-frame-pointer)
  target_compile_options(tsd_compile_options INTERFACE ${_tsd_san})
  target_link_options(tsd_compile_options INTERFACE ${_tsd_san})
endif()
if(TSD_COVERAGE)
  # Line and branch counts for the coverage report; no optimisation, so that
  # every line counts where it stands.
  target_compile_options(tsd_compile_options INTERFACE --coverage -O0)
  target_link_options(tsd_compile_options INTERFACE --coverage)
endif()
