# Writes the source that holds page.css and page.js, and the hashes by which the page's policy admits just these two.

# The base64 text of the SHA-256 hash of a text: CMake itself gives hexadecimal digits.
function(base64_hash text result)
  set(alphabet ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/)
  string(SHA256 hex "${text}")
  set(hash "")
  # 32 bytes are ten groups of three and one of two, which is filled with a zero byte.
  string(APPEND hex 00)
  foreach(group RANGE 10)
    math(EXPR start "6 * ${group}")
    string(SUBSTRING ${hex} ${start} 6 digits)
    foreach(shift 18 12 6 0)
      math(EXPR index "(0x${digits} >> ${shift}) & 63")
      string(SUBSTRING ${alphabet} ${index} 1 letter)
      string(APPEND hash ${letter})
    endforeach()
  endforeach()
  string(REGEX REPLACE ".$" "=" hash ${hash})
  set(${result} ${hash} PARENT_SCOPE)
endfunction()

get_filename_component(folder ${CMAKE_CURRENT_LIST_FILE} DIRECTORY)
file(READ ${folder}/page.css css)
file(READ ${folder}/page.js js)
base64_hash("${css}" css_hash)
base64_hash("${js}" js_hash)
file(WRITE ${OUTPUT} "#include \"report/page_files.h\"

namespace vexel_yaml {

const std::string_view kPageStyle = R\"PAGE(${css})PAGE\";
const std::string_view kPageStyleHash = \"sha256-${css_hash}\";
const std::string_view kPageScript = R\"PAGE(${js})PAGE\";
const std::string_view kPageScriptHash = \"sha256-${js_hash}\";

}  // namespace vexel_yaml
")
