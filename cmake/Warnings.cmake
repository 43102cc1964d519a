# One place for the flags every target of the project shares.
add_library(qen_flags INTERFACE)
target_compile_options(qen_flags INTERFACE -Wall -Wextra -Wpedantic)
if(QEN_WERROR)
  target_compile_options(qen_flags INTERFACE -Werror)
endif()
if(QEN_SANITIZE)
  target_compile_options(qen_flags INTERFACE -fsanitize=address,undefined -fno-omit-frame-pointer
                         -fno-sanitize-recover=undefined)
  target_link_options(qen_flags INTERFACE -fsanitize=address,undefined)
endif()
if(QEN_BUILD_FUZZ)
  # Coverage for the fuzzers reaches into the library, not only the fuzz entry points. Without
  # the sanitizers (QEN_FUZZ_SANITIZE=OFF) a target runs several times as many inputs a second,
  # for long runs that look for crashes, hangs and memory growth.
  if(QEN_FUZZ_SANITIZE)
    target_compile_options(qen_flags INTERFACE -fsanitize=fuzzer-no-link,address,undefined)
    target_link_options(qen_flags INTERFACE -fsanitize=address,undefined)
  else()
    target_compile_options(qen_flags INTERFACE -fsanitize=fuzzer-no-link)
  endif()
endif()
