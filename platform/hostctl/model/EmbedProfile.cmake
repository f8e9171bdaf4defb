# Writes OUT: a C++ file holding each JSON fragment of FRAGMENTS as a string.
set(body "// Generated from model/profiles/demo/*.json; do not edit.\n#include <string_view>\n#include <vector>\nnamespace Model {\nstd::vector<std::string_view> DemoProfileFragments() {\n  return {\n")
foreach(f IN LISTS FRAGMENTS)
  file(READ ${f} text)
  get_filename_component(name ${f} NAME)
  string(APPEND body "    // ${name}\n    R\"ostra_json(${text})ostra_json\",\n")
endforeach()
string(APPEND body "  };\n}\n} // namespace Model\n")
file(WRITE ${OUT} "${body}")
