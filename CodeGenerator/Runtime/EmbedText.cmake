# Writes the text of INPUT as the string hpn::RuntimeHeaderText into the C++ source OUTPUT.
file(READ ${INPUT} TEXT)
file(WRITE ${OUTPUT} "namespace hpn {\nextern const char* const RuntimeHeaderText;\nconst char* const RuntimeHeaderText = R\"hpn-text(${TEXT})hpn-text\";\n}\n")
