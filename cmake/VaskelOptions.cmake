# Compiler settings shared by every target of the project.

find_program(VASKEL_CCACHE ccache)
if(VASKEL_CCACHE)
    set(CMAKE_CXX_COMPILER_LAUNCHER "${VASKEL_CCACHE}")
endif()

add_library(vaskel_warnings INTERFACE)
if(MSVC)
    target_compile_options(vaskel_warnings INTERFACE /W4)
else()
    target_compile_options(vaskel_warnings INTERFACE -Wall -Wextra)
endif()

if(VASKEL_SANITIZE)
    add_compile_options(-fsanitize=${VASKEL_SANITIZE} -fno-omit-frame-pointer -fno-sanitize-recover=all)
    add_link_options(-fsanitize=${VASKEL_SANITIZE})
endif()
