# Makes the quillmap(1) manual page from the tool's help texts: help2man turns the top-level
# --help and --version into the page, and each subcommand's --help becomes a subsection.
# Run with cmake -DQUILLMAP=<tool> -DHELP2MAN=<help2man> -DOUTPUT=<page> -P quillmap_man.cmake.
execute_process(COMMAND ${QUILLMAP} --help OUTPUT_VARIABLE top RESULT_VARIABLE rc)
if(NOT rc EQUAL 0)
  message(FATAL_ERROR "'${QUILLMAP} --help' failed (${rc})")
endif()

# Subcommand names: the first word of each line of the "Subcommands:" list.
string(FIND "${top}" "Subcommands:" at)
if(at LESS 0)
  message(FATAL_ERROR "'${QUILLMAP} --help' lists no subcommands")
endif()
string(SUBSTRING "${top}" ${at} -1 listing)
string(REGEX MATCHALL "\n  [a-z][a-z-]*" names "${listing}")

set(extra "[SUBCOMMANDS]\n")
foreach(name ${names})
  string(STRIP "${name}" name)
  execute_process(COMMAND ${QUILLMAP} ${name} --help OUTPUT_VARIABLE text RESULT_VARIABLE rc)
  if(NOT rc EQUAL 0)
    message(FATAL_ERROR "'${QUILLMAP} ${name} --help' failed (${rc})")
  endif()
  # Kept as printed: backslashes escaped, and lines starting with a roff control character
  # made plain text.
  string(REPLACE "\\" "\\e" text "${text}")
  string(REGEX REPLACE "(^|\n)([.'])" "\\1\\\\&\\2" text "${text}")
  string(APPEND extra ".SS \"quillmap ${name}\"\n.nf\n${text}.fi\n")
endforeach()

get_filename_component(dir "${OUTPUT}" DIRECTORY)
set(include_file "${dir}/quillmap.h2m")
file(WRITE "${include_file}" "${extra}")
execute_process(
  COMMAND ${HELP2MAN} --no-info --section 1
          --name "annotate FPGA netlists with UCF and NCF constraints"
          --include "${include_file}" --output "${OUTPUT}" ${QUILLMAP}
  RESULT_VARIABLE rc)
if(NOT rc EQUAL 0)
  message(FATAL_ERROR "help2man failed (${rc})")
endif()
