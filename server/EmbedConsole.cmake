# cmake -DOUTPUT=file.cpp "-DFILES=index.html;style.css" -P EmbedConsole.cmake
# Writes a source with the text of each file as a raw string, under the file's name without its folder, and a tag that
# changes with the text.
set(largest 60000)  # the server sends a longer response in pieces, which needs a worker
set(source "#include \"server/ConsolePages.h\"\n\nnamespace zorva::server {\n\nconst ConsoleFile kConsoleFiles[] = {\n")
foreach(file ${FILES})
  get_filename_component(name ${file} NAME)
  file(READ ${file} text)
  file(SHA256 ${file} tag)
  file(SIZE ${file} size)
  if(size GREATER largest)
    message(FATAL_ERROR "${file} has more than ${largest} bytes: split it")
  endif()
  string(SUBSTRING ${tag} 0 16 tag)
  string(APPEND source "    {\"${name}\", \"${tag}\", R\"CONSOLE(${text})CONSOLE\"},\n")
endforeach()
list(LENGTH FILES count)
string(APPEND source "};\n\nconst std::size_t kConsoleFileCount = ${count};\n\n}  // namespace zorva::server\n")
file(WRITE ${OUTPUT} "${source}")
