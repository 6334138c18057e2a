# Writes OUTPUT, a C++ source that defines bridge::NAME, declared in HEADER, with the text of SCRIPT.
file(READ ${SCRIPT} text)
if(text MATCHES "\\)script\"")
  message(FATAL_ERROR "${SCRIPT} holds the end of the literal that it goes into")
endif()
file(WRITE ${OUTPUT} "#include \"${HEADER}\"\n\nnamespace bridge {\n\nconst char ${NAME}[] = R\"script(${text})script\";\n\n} // namespace bridge\n")
