# Writes the source that holds a page's style and script, and the hashes by which its policy admits just these two:
#   cmake -DOUTPUT=FILE.cpp -DHEADER=HEADER -DNAME=Page -DSTYLES="FILE ..." -DSCRIPTS="FILE ..." [-DPAGE=FILE] -P ...
# In a PAGE, which is then held as well, {{style}} and {{script}} stand for them.

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

# The files one behind the other.
function(read_all files result)
  separate_arguments(files)
  set(all "")
  foreach(file ${files})
    file(READ ${file} text)
    string(APPEND all "${text}")
  endforeach()
  set(${result} "${all}" PARENT_SCOPE)
endfunction()

read_all("${STYLES}" css)
read_all("${SCRIPTS}" js)
base64_hash("${css}" css_hash)
base64_hash("${js}" js_hash)
set(constants
"const std::string_view k${NAME}StyleHash = \"sha256-${css_hash}\";
const std::string_view k${NAME}ScriptHash = \"sha256-${js_hash}\";
")
if(PAGE)
  file(READ ${PAGE} html)
  string(REPLACE "{{style}}" "${css}" html "${html}")
  string(REPLACE "{{script}}" "${js}" html "${html}")
  string(APPEND constants "const std::string_view k${NAME}Page = R\"PAGE(${html})PAGE\";\n")
else()
  string(APPEND constants "const std::string_view k${NAME}Style = R\"PAGE(${css})PAGE\";
const std::string_view k${NAME}Script = R\"PAGE(${js})PAGE\";
")
endif()
file(WRITE ${OUTPUT} "#include \"${HEADER}\"

namespace vexel_yaml {

${constants}
}  // namespace vexel_yaml
")
