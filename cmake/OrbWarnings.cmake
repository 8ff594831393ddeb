# SPDX-License-Identifier: MIT
# Warnings and sanitizers of our own targets, never of those who use the library.
add_library(orb_warnings INTERFACE)
target_compile_options(orb_warnings INTERFACE
  -Wall -Wextra -Wpedantic -Wshadow -Wconversion -Wsign-conversion -Wnon-virtual-dtor
  -Woverloaded-virtual -Wcast-align -Wformat-security)
if(ORB_WERROR)
  target_compile_options(orb_warnings INTERFACE -Werror)
endif()
if(ORB_SANITIZE)
  # Without vptr: its check opens a pipe, so it fails in the tests that take all descriptors away.
  target_compile_options(orb_warnings INTERFACE -fsanitize=${ORB_SANITIZE} -fno-omit-frame-pointer
    -fno-sanitize-recover=all -fno-sanitize=vptr)
  target_link_options(orb_warnings INTERFACE -fsanitize=${ORB_SANITIZE})
endif()
