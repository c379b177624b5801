# The module as a 32-bit Windows DLL: its loader entry point, the host's two
# libraries through import libraries made from the .def files that list their
# calls, and the C and C++ runtimes linked in, so that the DLL needs nothing
# but the host's two libraries and Windows system DLLs.
set(RNSAP_WINDOWS_DIR ${PROJECT_SOURCE_DIR}/boundary/windows)
if(NOT CMAKE_DLLTOOL)
  message(FATAL_ERROR "No dlltool to make the import libraries of the host's libraries")
endif()

set(RNSAP_HOST_IMPORT_LIBRARIES)
foreach(host_library pu_ParserUtilities kf_OptSupport)
  set(import_library ${CMAKE_BINARY_DIR}/lib${host_library}.dll.a)
  add_custom_command(
    OUTPUT ${import_library}
    COMMAND ${CMAKE_DLLTOOL} --input-def ${RNSAP_WINDOWS_DIR}/${host_library}.def
            --dllname ${host_library}.dll --output-lib ${import_library}
    DEPENDS ${RNSAP_WINDOWS_DIR}/${host_library}.def
    COMMENT "Making the import library of ${host_library}.dll"
    VERBATIM)
  list(APPEND RNSAP_HOST_IMPORT_LIBRARIES ${import_library})
endforeach()
add_custom_target(rnsap_host_import_libraries DEPENDS ${RNSAP_HOST_IMPORT_LIBRARIES})

# A DLL under its plain name, with the C and C++ runtimes linked in and
# without debug sections (those of the MinGW runtime libraries included).
function(rnsap_link_windows_runtime target)
  set_target_properties(${target} PROPERTIES PREFIX "")
  target_link_options(${target} PRIVATE -static -static-libgcc -static-libstdc++ -s
                      -Wl,--no-undefined)
endfunction()

function(rnsap_link_windows_dll target)
  target_sources(${target} PRIVATE ${RNSAP_WINDOWS_DIR}/dll_main.cpp)
  add_dependencies(${target} rnsap_host_import_libraries)
  target_link_libraries(${target} PRIVATE ${RNSAP_HOST_IMPORT_LIBRARIES})
  rnsap_link_windows_runtime(${target})
endfunction()
