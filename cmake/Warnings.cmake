# Warnings for every target of the project. They become errors only when
# QN_WERROR is on: the developer and CI builds turn it on, while users and
# packagers building a release with another compiler version are not stopped
# by a warning that version adds.
option(QN_WERROR "Treat compiler warnings as errors" OFF)
# g++ 12 reports overlapping copies that cannot happen (-Wrestrict) inside
# std::string assignments it inlines at -O3 (assigning a short literal is
# enough), so an optimised build of correct code would stop at them.
set(QN_GCC12_RESTRICT
  $<$<AND:$<CXX_COMPILER_ID:GNU>,$<VERSION_LESS:$<CXX_COMPILER_VERSION>,13>,$<CONFIG:Release,MinSizeRel>>:-Wno-restrict>)
function(qn_warnings target)
  target_compile_options(${target} PRIVATE -Wall -Wextra -Wpedantic
    -Wshadow -Wnon-virtual-dtor -Wcast-align -Wformat=2 ${QN_GCC12_RESTRICT}
    $<$<BOOL:${QN_WERROR}>:-Werror>)
endfunction()
