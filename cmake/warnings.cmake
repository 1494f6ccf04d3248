# Warnings are errors for the project's own code (not for the libraries it
# builds from their sources).
function(ironvale_warnings target)
  if(MSVC)
    target_compile_options(${target} PRIVATE /W4 /WX)
  else()
    target_compile_options(${target} PRIVATE -Wall -Wextra -Wshadow -Wnon-virtual-dtor -Werror)
  endif()
endfunction()
