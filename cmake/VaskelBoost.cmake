# Boost, header-only here: vaskel_boost carries its include directory. A
# cross build uses the build machine's headers, which decide the target's
# settings at compile time, through a directory that holds nothing else, so
# that no other header of the build machine reaches the target's compiler.
if(CMAKE_CROSSCOMPILING)
    set(VASKEL_BOOST_ROOT /usr/include CACHE PATH "Directory that holds the boost headers")
    if(NOT EXISTS ${VASKEL_BOOST_ROOT}/boost/version.hpp)
        message(FATAL_ERROR "No Boost headers in ${VASKEL_BOOST_ROOT} (install libboost-dev)")
    endif()
    set(vaskel_boost_dir ${CMAKE_BINARY_DIR}/boost-headers)
    file(MAKE_DIRECTORY ${vaskel_boost_dir})
    file(CREATE_LINK ${VASKEL_BOOST_ROOT}/boost ${vaskel_boost_dir}/boost SYMBOLIC)
    add_library(vaskel_boost INTERFACE)
    target_include_directories(vaskel_boost SYSTEM INTERFACE ${vaskel_boost_dir})
else()
    find_package(Boost 1.70 REQUIRED)
    add_library(vaskel_boost INTERFACE)
    target_link_libraries(vaskel_boost INTERFACE Boost::headers)
endif()
