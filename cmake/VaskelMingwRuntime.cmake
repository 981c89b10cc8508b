# The mingw-w64 runtime DLLs the programs load (C++ library, unwinder,
# threads), copied beside them so that a build or install folder runs as it is.
set(VASKEL_RUNTIME_DLLS)
foreach(dll libstdc++-6.dll libgcc_s_seh-1.dll libgcc_s_dw2-1.dll libwinpthread-1.dll)
    execute_process(COMMAND ${CMAKE_CXX_COMPILER} -print-file-name=${dll}
                    OUTPUT_VARIABLE path OUTPUT_STRIP_TRAILING_WHITESPACE)
    if(IS_ABSOLUTE "${path}" AND EXISTS "${path}")
        list(APPEND VASKEL_RUNTIME_DLLS "${path}")
    endif()
endforeach()
file(COPY ${VASKEL_RUNTIME_DLLS} DESTINATION ${CMAKE_RUNTIME_OUTPUT_DIRECTORY})
