# Writes the page's files, which lie beside this one, as C++ source OUTPUT.

foreach(file html css js)
    file(READ ${CMAKE_CURRENT_LIST_DIR}/page.${file} ${file})
endforeach()
file(WRITE ${OUTPUT} "#include \"emulator/web/WebFiles.h\"

namespace emulator {

const std::array<WebFile, 3> webFiles{{
    {\"\", \"text/html; charset=utf-8\", R\"--(${html})--\"},
    {\"page.css\", \"text/css; charset=utf-8\", R\"--(${css})--\"},
    {\"page.js\", \"text/javascript; charset=utf-8\", R\"--(${js})--\"},
}};

} // namespace emulator
")
