# Warnings for every target of the project. They become errors only when
# QN_WERROR is on: the developer and CI builds turn it on, while users and
# packagers building a release with another compiler version are not stopped
# by a warning that version adds.
option(QN_WERROR "Treat compiler warnings as errors" OFF)
function(qn_warnings target)
  target_compile_options(${target} PRIVATE -Wall -Wextra -Wpedantic
    -Wshadow -Wnon-virtual-dtor -Wcast-align -Wformat=2
    $<$<BOOL:${QN_WERROR}>:-Werror>)
endfunction()
