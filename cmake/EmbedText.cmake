# Writes the file IN as a C++ raw string constant SYMBOL into OUT.
file(READ ${IN} content)
set(delim "QENTXT")
file(WRITE ${OUT} "// Generated from ${IN}; do not edit.\nextern const char* const ${SYMBOL};\nconst char* const ${SYMBOL} = R\"${delim}(${content})${delim}\";\n")
