# What every file of the project is compiled with. Contraction is off for everything, tests and product
# alike: a stated rounding is part of the result.
add_library(zr_rules INTERFACE)
target_compile_features(zr_rules INTERFACE cxx_std_20 c_std_11)
target_compile_options(zr_rules INTERFACE
  -ffp-contract=off -Wall -Wextra -Wshadow
  $<$<COMPILE_LANGUAGE:CXX>:-Wconversion>
  $<$<BOOL:${ZR_WARNINGS_ARE_ERRORS}>:-Werror>)
if(ZR_SANITIZE)
  target_compile_options(zr_rules INTERFACE -fsanitize=${ZR_SANITIZE} -fno-omit-frame-pointer -g)
  target_compile_definitions(zr_rules INTERFACE ZR_SANITIZED)  # no instructions that the sanitizer cannot see
  add_link_options(-fsanitize=${ZR_SANITIZE})  # programs that link products only need it too
  if(ZR_SANITIZE MATCHES "undefined")
    target_compile_options(zr_rules INTERFACE -fno-sanitize-recover=undefined)
  endif()
endif()
if(ZR_BUILD_FUZZ)  # the fuzzer follows which branches its inputs take
  target_compile_options(zr_rules INTERFACE -fsanitize=fuzzer-no-link)
endif()
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_C_EXTENSIONS OFF)
# -O3 for the row loops; assertions of the standard library stay out of release builds.
set(CMAKE_CXX_FLAGS_RELEASE "-O3 -DNDEBUG")
