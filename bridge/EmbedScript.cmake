# Writes OUTPUT, a C++ source that defines bridge::kPageScript with the text of SCRIPT.
file(READ ${SCRIPT} text)
if(text MATCHES "\\)script\"")
  message(FATAL_ERROR "${SCRIPT} holds the end of the literal that it goes into")
endif()
file(WRITE ${OUTPUT} "#include \"bridge/PageScript.h\"\n\nnamespace bridge {\n\nconst char kPageScript[] = R\"script(${text})script\";\n\n} // namespace bridge\n")
