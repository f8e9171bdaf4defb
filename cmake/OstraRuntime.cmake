# One C++ runtime in the process, carried by ostracli.
#
# ostracli links libstdc++ statically and whole, and exports it with the rest
# of its symbols; the modules it loads (the plug-ins, the Linux host) are
# linked without a runtime of their own, so their references to it bind to
# ostracli's copy when they are loaded. The shared libstdc++ is then not
# loaded at all (it was about a fifth of every start: its own relocations and
# the look-ups of the symbols that reach it). A module that still needs it
# (network-uplinks.so, through the shared Boost.Regex) loads it on first use;
# its symbols are then found in ostracli first, so exceptions, type
# information and the allocator stay those of one runtime. A run that loads
# the modules into a program with the shared runtime (unit tests, ostrahost)
# binds them to that one instead.
#
# Sanitizer builds keep the shared runtime: a static operator new would hide
# the sanitizer's own.
option(OSTRA_STATIC_RUNTIME "ostracli carries the C++ runtime; its modules bring none" ON)
set(OSTRA_USE_STATIC_RUNTIME OFF)
if(OSTRA_STATIC_RUNTIME AND NOT OSTRA_SANITIZE AND NOT OSTRA_FUZZ
   AND CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
  execute_process(COMMAND ${CMAKE_CXX_COMPILER} -print-file-name=libstdc++.a
                  OUTPUT_VARIABLE OSTRA_LIBSTDCXX_ARCHIVE OUTPUT_STRIP_TRAILING_WHITESPACE)
  if(IS_ABSOLUTE "${OSTRA_LIBSTDCXX_ARCHIVE}" AND EXISTS "${OSTRA_LIBSTDCXX_ARCHIVE}")
    set(OSTRA_USE_STATIC_RUNTIME ON)
  endif()
endif()

# The program that carries the runtime for the modules it loads.
function(ostra_runtime_carrier target)
  if(OSTRA_USE_STATIC_RUNTIME)
    # SHELL: keeps the group whole; target_link_options drops repeated options.
    target_link_options(${target} PRIVATE -static-libstdc++
      "SHELL:-Wl,--whole-archive ${OSTRA_LIBSTDCXX_ARCHIVE} -Wl,--no-whole-archive")
  endif()
endfunction()

# A module that uses the runtime of the program that loads it.
function(ostra_runtime_module target)
  if(OSTRA_USE_STATIC_RUNTIME)
    target_link_options(${target} PRIVATE -nodefaultlibs)
    target_link_libraries(${target} PRIVATE c gcc_s gcc)
  endif()
endfunction()
