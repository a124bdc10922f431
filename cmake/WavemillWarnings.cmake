# wavemill_enable_warnings(<target>)
#
# The one place where Wavemill's own targets get their warning flags. With
# WAVEMILL_WERROR on (the dev and sanitizer presets, and so CI) every warning
# fails the build. The flags are PRIVATE: nothing here reaches a consumer.
function(wavemill_enable_warnings target)
  if(CMAKE_CXX_COMPILER_ID MATCHES "GNU|Clang")
    target_compile_options(${target} PRIVATE -Wall -Wextra)
    if(WAVEMILL_WERROR)
      target_compile_options(${target} PRIVATE -Werror)
    endif()
  elseif(MSVC)
    target_compile_options(${target} PRIVATE /W4)
    if(WAVEMILL_WERROR)
      target_compile_options(${target} PRIVATE /WX)
    endif()
  endif()
endfunction()
