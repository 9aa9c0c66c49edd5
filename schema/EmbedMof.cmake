# cmake -DOUTPUT=file.cpp "-DFILES=a.mof;b.mof" -P EmbedMof.cmake
# Writes a source with the text of each file as a raw string, under the file's name without its folder.
set(source "#include \"schema/BuiltInMof.h\"\n\nnamespace zorva::schema {\n\nconst BuiltInMof kBuiltInMof[] = {\n")
foreach(file ${FILES})
  get_filename_component(name ${file} NAME)
  file(READ ${file} text)
  string(APPEND source "    {\"${name}\", R\"MOF-TEXT(${text})MOF-TEXT\"},\n")
endforeach()
list(LENGTH FILES count)
string(APPEND source "};\n\nconst std::size_t kBuiltInMofCount = ${count};\n\n}  // namespace zorva::schema\n")
file(WRITE ${OUTPUT} "${source}")
