# Writes a linker script that gives every LRM_X of a library the name RM_X too.
#   cmake -DNM=nm -DLIBRARY=liblrmapi.so -DOUTPUT=file -P aliases.cmake
execute_process(COMMAND "${NM}" -D --defined-only "${LIBRARY}"
                OUTPUT_VARIABLE symbols COMMAND_ERROR_IS_FATAL ANY)
string(REGEX MATCHALL "[^A-Za-z0-9_]LRM_[A-Za-z0-9_]+" names "${symbols}")
list(SORT names)
set(script "/* Made from the exports of the newer library; do not edit. */\n")
foreach(name IN LISTS names)
  string(REGEX REPLACE "^.LRM_" "" name "${name}")
  string(APPEND script "RM_${name} = LRM_${name};\n")
endforeach()
file(WRITE "${OUTPUT}" "${script}")
