# Writes the linker version script of the shared library from the list of
# exported symbols (cmake/exported_symbols.txt): C names as they are, C++
# names (those with "::" or a space) under extern "C++", a trailing * kept as
# the wildcard. Everything else stays local.
function(veltmarquist_export_map list output)
  file(STRINGS ${list} entries REGEX "^[^#]")
  set(c_names "")
  set(cxx_names "")
  foreach(entry IN LISTS entries)
    if(entry MATCHES "::|[ ]")
      if(entry MATCHES "\\*$")
        string(APPEND cxx_names "      ${entry};\n")
      else()
        string(APPEND cxx_names "      \"${entry}\";\n")
      endif()
    else()
      string(APPEND c_names "    ${entry};\n")
    endif()
  endforeach()
  file(CONFIGURE OUTPUT ${output} CONTENT
"/* Generated from ${list}. */
{
  global:
${c_names}    extern \"C++\" {
${cxx_names}    };
  local: *;
};
" @ONLY)
  set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${list})
endfunction()
