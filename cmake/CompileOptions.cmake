# What every target of the project is compiled and linked with.

function(pelm_compile_options target)
  target_compile_options(${target} PRIVATE -Wall -Wextra -Wshadow -Wconversion)
  if(PELM_WARNINGS_AS_ERRORS)
    target_compile_options(${target} PRIVATE -Werror)
  endif()
endfunction()

# The libraries' own code is compiled so that each line keeps its counter, and so are the tests that compile templates of
# it. To count the others would only take time.
function(pelm_count_execution target)
  if(PELM_COVERAGE)
    target_compile_options(${target} PRIVATE --coverage -Og -fno-early-inlining ${ARGN})
  endif()
endfunction()
if(PELM_COVERAGE)
  add_link_options(--coverage)
endif()

if(PELM_SANITIZE)
  add_compile_options(-fsanitize=${PELM_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
  add_link_options(-fsanitize=${PELM_SANITIZE})
  if(PELM_SANITIZE STREQUAL "memory")
    # The C++ library is not instrumented: its strings are compiled with the tests instead.
    add_compile_definitions(_GLIBCXX_EXTERN_TEMPLATE=0)
  endif()
endif()
