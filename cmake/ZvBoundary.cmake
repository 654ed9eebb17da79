# The module reaches the host only through cad/ and the plug-in SDK (host/sdk/).
# Outside cad/, a module source may not include any other host header, nor climb out of
# its folder with "../". cad/ sources get the host include folder as a source property;
# the other module sources are compiled without it, so a host header does not even build.
set(ZV_MODULE_FOLDERS module readers lists strips topographic export cad catalogue settings
    dialogs)

function(zv_check_module_boundary root)
    set(violations "")
    foreach(folder IN LISTS ZV_MODULE_FOLDERS)
        file(GLOB_RECURSE files CONFIGURE_DEPENDS ${root}/${folder}/*.h ${root}/${folder}/*.cpp)
        foreach(file IN LISTS files)
            file(STRINGS ${file} includes REGEX "^[ \t]*#[ \t]*include[ \t]*[\"<]")
            foreach(line IN LISTS includes)
                set(bad FALSE)
                if(line MATCHES "[\"<]\\.\\./")
                    set(bad TRUE)
                elseif(line MATCHES "[\"<]host/" AND NOT line MATCHES "[\"<]host/sdk/")
                    set(bad TRUE)
                elseif(NOT folder STREQUAL "cad" AND
                       line MATCHES "[\"<](drawing|lisp|product|plot|app)/")
                    set(bad TRUE)
                endif()
                if(bad)
                    file(RELATIVE_PATH rel ${root} ${file})
                    string(STRIP "${line}" line)
                    list(APPEND violations "${rel}: ${line}")
                endif()
            endforeach()
        endforeach()
    endforeach()
    if(violations)
        list(JOIN violations "\n  " text)
        message(FATAL_ERROR "Module code includes host headers outside cad/:\n  ${text}")
    endif()
endfunction()
