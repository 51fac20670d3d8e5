# Turns every "*.nls" catalog file of a folder into a C++ source that
# registers the texts when the library loads, so no file is needed at run time.
function(zon_embed_catalogs out_var tag folder)
  file(GLOB catalogs CONFIGURE_DEPENDS ${folder}/*.nls)
  set(body "")
  foreach(catalog ${catalogs})
    get_filename_component(name ${catalog} NAME_WE)
    file(READ ${catalog} text)
    set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${catalog})
    string(APPEND body "        ZonMsgCatalog::RegisterEmbedded(\"${name}\", R\"zoncat(${text})zoncat\");\n")
  endforeach()
  set(generated ${CMAKE_BINARY_DIR}/generated/ZonEmbeddedCatalogs_${tag}.cpp)
  file(WRITE ${generated}.tmp
"// Generated from the catalog files; do not edit.
#include \"ZonMsgCatalog.h\"

namespace {
struct ZonEmbeddedCatalogs {
    ZonEmbeddedCatalogs()
    {
${body}    }
};
const ZonEmbeddedCatalogs registration;
}  // namespace
")
  file(COPY_FILE ${generated}.tmp ${generated} ONLY_IF_DIFFERENT)
  set(${out_var} ${generated} PARENT_SCOPE)
endfunction()
