# Warnings are errors in every target of ours (not in third-party code built alongside).
function(photofx_warnings target)
  target_compile_options(${target} PRIVATE -Wall -Wextra -Werror)
endfunction()
