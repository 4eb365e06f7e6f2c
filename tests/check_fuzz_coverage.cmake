# Fails unless every exported name of the library (the lists in EXPORTS_DIR) is used by the code
# of some fuzz target (FUZZ_DIR/fuzz_*.cpp): a function called, a global read or written. Constant
# tables (declared `extern const` in HEADER) are exempt: there is nothing to fuzz in them, and the
# unit tests recompute them. Comments and string literals do not count as uses, so naming a
# function in an operation's label or a remark is not coverage.
#
#   cmake -DEXPORTS_DIR=tests/exports -DHEADER=include/photofx.h -DFUZZ_DIR=fuzz \
#         -P check_fuzz_coverage.cmake
#   cmake -DSELF_TEST=ON -DWORK_DIR=<scratch dir> -P check_fuzz_coverage.cmake
#
# The self-test runs the check on a small made-up project whose gaps are known, so that a check
# that had stopped finding anything would fail.
cmake_minimum_required(VERSION 3.25)

# Names listed in the export lists that no fuzz target uses, sorted.
function(uncovered_exports exports_dir header fuzz_dir out)
  file(GLOB lists ${exports_dir}/*.txt)
  set(names "")
  foreach(list_file IN LISTS lists)
    file(STRINGS ${list_file} lines)
    foreach(name IN LISTS lines)
      string(STRIP "${name}" name)
      if(NOT name STREQUAL "" AND NOT name MATCHES "^#")
        list(APPEND names "${name}")
      endif()
    endforeach()
  endforeach()

  file(READ ${header} header_text)
  string(REGEX MATCHALL "extern const [^;]*" declarations "${header_text}")
  set(tables "")
  foreach(declaration IN LISTS declarations)
    if(declaration MATCHES "([A-Za-z_][A-Za-z0-9_]*)[ \t]*(\\[[A-Za-z0-9_ ]*\\])?[ \t]*$")
      list(APPEND tables "${CMAKE_MATCH_1}")
    endif()
  endforeach()

  file(GLOB sources ${fuzz_dir}/fuzz_*.cpp)
  set(code "")
  foreach(source IN LISTS sources)
    file(READ ${source} text)
    # Block comments, then line comments, then string literals.
    while(TRUE)
      string(FIND "${text}" "/*" open)
      if(open EQUAL -1)
        break()
      endif()
      string(SUBSTRING "${text}" 0 ${open} head)
      string(SUBSTRING "${text}" ${open} -1 rest)
      string(FIND "${rest}" "*/" close)
      if(close EQUAL -1)
        set(text "${head}")
        break()
      endif()
      math(EXPR close "${close} + 2")
      string(SUBSTRING "${rest}" ${close} -1 rest)
      set(text "${head} ${rest}")
    endwhile()
    string(REGEX REPLACE "//[^\n]*" "" text "${text}")
    string(REGEX REPLACE "\"[^\"\n]*\"" "\"\"" text "${text}")
    string(APPEND code "${text}\n")
  endforeach()

  set(missing "")
  foreach(name IN LISTS names)
    if(name IN_LIST tables)
      continue()
    endif()
    if(NOT code MATCHES "(^|[^A-Za-z0-9_])${name}([^A-Za-z0-9_]|$)")
      list(APPEND missing "${name}")
    endif()
  endforeach()
  list(SORT missing)
  set(${out} "${missing}" PARENT_SCOPE)
endfunction()

if(SELF_TEST)
  set(root ${WORK_DIR}/fuzz_coverage_fixture)
  file(REMOVE_RECURSE ${root})
  file(WRITE ${root}/exports/a.txt "# fixture\ncalled\nin_comment\nin_string\n\nTABLE\ncounter\n")
  file(WRITE ${root}/exports/b.txt "in_block_comment\nprefix_only\nset_counter\n")
  file(WRITE ${root}/photofx.h
    "PHOTOFX_API extern const int32_t TABLE[4]; /* exempt */\n"
    "PHOTOFX_API extern int32_t counter;\n")
  file(WRITE ${root}/fuzz/fuzz_one.cpp
    "// in_comment is only mentioned here\n"
    "const Op kOps[] = {{\"in_string\", run}};\n"
    "void run() { called(1); counter = 2; set_counter_twice(); }\n")
  file(WRITE ${root}/fuzz/fuzz_two.cpp "/* in_block_comment\n */ int x = prefix_only_not;\n")
  file(WRITE ${root}/fuzz/other.cpp "void helper() { set_counter(); }\n")
  uncovered_exports(${root}/exports ${root}/photofx.h ${root}/fuzz found)
  set(expected in_block_comment in_comment in_string prefix_only set_counter)
  if(NOT found STREQUAL expected)
    message(FATAL_ERROR "self-test: found '${found}', expected '${expected}'")
  endif()
  message(STATUS "self-test: the check reports exactly the planted gaps")
  return()
endif()

uncovered_exports(${EXPORTS_DIR} ${HEADER} ${FUZZ_DIR} missing)
if(missing)
  string(REPLACE ";" " " missing "${missing}")
  message(FATAL_ERROR "exported but used by no fuzz target (fuzz/fuzz_*.cpp): ${missing}")
endif()
message(STATUS "every exported function and global is used by a fuzz target")
