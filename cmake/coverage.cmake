# QUILLANE_COVERAGE: every target of ours counts the lines and branches it
# runs (gcc's --coverage), for scripts/coverage.sh to report. Use it with a
# Debug build, so that the counts follow the source lines.
option(QUILLANE_COVERAGE "Count line and branch coverage (gcc --coverage)" OFF)
if(QUILLANE_COVERAGE)
    if(NOT CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
        message(FATAL_ERROR "QUILLANE_COVERAGE needs gcc; this is ${CMAKE_CXX_COMPILER_ID}")
    endif()
    # The generator writes on several threads; counters updated without
    # atomics race there and come out as nonsense (negative branch counts).
    target_compile_options(quillane_options INTERFACE --coverage -fprofile-update=atomic)
    target_link_options(quillane_options INTERFACE --coverage -fprofile-update=atomic)
    target_compile_definitions(quillane_options INTERFACE QUILLANE_COVERAGE)
endif()
