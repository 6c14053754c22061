# cmake -DMODULE=veltrane.dll -P module_tables.cmake: the DLL's export table must name exactly
# PluginInfo and Notify, undecorated, and it may import only Windows' own DLLs and opengl32.dll
# (no compiler runtime, no GLEW).
cmake_minimum_required(VERSION 3.25)
execute_process(COMMAND x86_64-w64-mingw32-objdump -p ${MODULE} OUTPUT_VARIABLE dump
                COMMAND_ERROR_IS_FATAL ANY)

# The export names are the "[n] name" rows of the table that follows this heading.
string(REGEX REPLACE ".*\\[Ordinal/Name Pointer\\] Table[^\n]*\n" "" names "${dump}")
string(REGEX REPLACE "\n\n.*" "" names "${names}")
string(REGEX REPLACE "\t\\[ *[0-9]+\\] ([^\n]+)\n?" "\\1;" exports "${names}")
list(REMOVE_ITEM exports "")
list(SORT exports)
if(NOT exports STREQUAL "Notify;PluginInfo")
  message(FATAL_ERROR "${MODULE}: exports '${exports}', expected exactly Notify and PluginInfo")
endif()

set(allowed advapi32.dll gdi32.dll kernel32.dll msvcrt.dll ntdll.dll opengl32.dll user32.dll)
string(REGEX MATCHALL "DLL Name: [^\n]+" imports "${dump}")
foreach(entry ${imports})
  string(REGEX REPLACE "DLL Name: " "" dll "${entry}")
  string(TOLOWER "${dll}" dll)
  if(NOT dll IN_LIST allowed)
    message(FATAL_ERROR "${MODULE}: imports ${dll}; expected only ${allowed}")
  endif()
endforeach()
if(NOT imports)
  message(FATAL_ERROR "${MODULE}: no import table")
endif()
