# What every target is compiled with.
add_library(vexo_settings INTERFACE)
target_compile_options(vexo_settings INTERFACE -Wall -Wextra -Wpedantic -Wshadow -Wnon-virtual-dtor
                                               -Woverloaded-virtual -fno-omit-frame-pointer)
# Nobody puts functions of their own in the place of our libraries', so a library's calls of its own functions need not
# go through its table of symbols and can be inlined.
target_compile_options(vexo_settings INTERFACE -fno-semantic-interposition)
target_link_options(vexo_settings INTERFACE LINKER:-Bsymbolic-functions)
# Operations and fields of the system begin with an underscore and keep their names to the letter. As class
# members they clash with nothing, so Clang's warning about reserved names says nothing useful here.
if(CMAKE_CXX_COMPILER_ID STREQUAL "Clang")
    target_compile_options(vexo_settings INTERFACE -Wno-reserved-identifier -Wthread-safety)
endif()
# What is said of files compiled as one, and holds for none of them alone: that a local name hides another file's
# constant, and that what only one file sees is part of a class of a header.
set(of_several_files $<BOOL:$<TARGET_PROPERTY:UNITY_BUILD>>)
target_compile_options(vexo_settings INTERFACE $<${of_several_files}:-Wno-shadow>
                       $<$<AND:${of_several_files},$<CXX_COMPILER_ID:GNU>>:-Wno-subobject-linkage>)
# GCC 12 reports members of a std::variant as uninitialized that are not the one it holds, and copies beyond the
# end (or onto itself) in the strings that "literal" + std::string makes, both only when it optimizes.
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    target_compile_options(vexo_settings INTERFACE -Wno-maybe-uninitialized -Wno-array-bounds -Wno-stringop-overflow
                                                   -Wno-restrict)
endif()
if(VEXO_WARNINGS_AS_ERRORS)
    target_compile_options(vexo_settings INTERFACE -Werror)
endif()
if(VEXO_SANITIZE)
    target_compile_options(vexo_settings INTERFACE -fsanitize=${VEXO_SANITIZE} -fno-sanitize-recover=all)
    target_link_options(vexo_settings INTERFACE -fsanitize=${VEXO_SANITIZE})
endif()

find_program(CCACHE ccache)
if(CCACHE)
    set(CMAKE_CXX_COMPILER_LAUNCHER ${CMAKE_COMMAND} -E env
        CCACHE_SLOPPINESS=pch_defines,time_macros,include_file_mtime,include_file_ctime ${CCACHE})
endif()
