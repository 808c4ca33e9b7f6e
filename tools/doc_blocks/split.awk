# SPDX-License-Identifier: Apache-2.0
# Takes the code blocks out of a page, as files that check_page.sh compiles and runs:
#   awk -v page=<name in messages> -v out=<folder> -f split.awk <page>.md
# HACKING.md says how the comments above a fence steer it ("A code block"). Writes to <out>:
#   steps            what is to be done, a line for each in the order of the page:
#                    <what> <number> <line of the page> <how>
#   <number>.<tag>   a program, a script, or text
#   fragments.<tag>  the fragments of one language, each in a function of its own
# A fence that it cannot place is told as page:line: text, and ends it with status 1.
# Plain POSIX awk.

function fail(line, text) {
  print page ":" line ": " text "\n" > "/dev/stderr"
  status = 1
}

function step(what, how) {
  print what " " number " " at " " how "\n" > (out "/steps")
}

# The code with compilers told where it stands; `marked` for languages that have a #line.
function placed(code, line, marked) {
  if (code == "") return ""
  return (marked ? "#line " line " \"" page "\"\n" : "") code
}

function is_program(    lines, i, n) {
  n = split(code, lines, "\n")
  for (i = 1; i <= n; i++)
    if (tag == "fortran" ? lines[i] ~ /^ *program +[a-z]/ : lines[i] ~ /(^|[^A-Za-z_])main *\(/)
      return 1
  return 0
}

# Moves the #include lines to the head of the fragments; the others keep their line numbers.
function without_includes(text,    lines, i, n, rest) {
  n = split(text, lines, "\n")
  rest = ""
  for (i = 1; i < n; i++) {
    if (lines[i] ~ /^ *#include/) {
      includes[tag] = includes[tag] lines[i] "\n"
      lines[i] = ""
    }
    rest = rest lines[i] "\n"
  }
  return rest
}

function close_function() {
  if (open_function) fragments[open_tag] = fragments[open_tag] "}\n"
  open_function = 0
}

function add_fragment(    text) {
  text = placed(without_includes(before), before_at, 1) placed(without_includes(code), at + 1, 1) \
         placed(without_includes(after), after_at, 1)
  if (how == "continue" && (!open_function || open_tag != tag))
    fail(at, "continues no fragment")
  if (how != "continue") close_function()
  if (how != "continue" && how != "file") {
    fragments[tag] = fragments[tag] "static void block_" at "(void) {\n"
    calls[tag] = calls[tag] "    {" at ", block_" at "},\n"
    open_function = 1
    open_tag = tag
    owner = at
  }
  fragments[tag] = fragments[tag] text
  if (!(tag in begun)) step("fragments", tag)
  begun[tag] = 1
}

# print, since the printf of some awks has a buffer of a few thousand characters.
function write_fragments(    t, file) {
  close_function()
  for (t in begun) {
    file = out "/fragments." t
    print "// The fragments of " page ".\n" includes[t] > file
    print "#include \"preamble." (t == "c" ? "h" : "hpp") "\"\n" fragments[t] > file
    print "static const doc_block blocks[] = {\n" calls[t] "    {0, 0}};\n" > file
    print "int main(void) { return run_blocks(blocks); }\n" > file
  }
}

function write_program(    marked, text) {
  marked = tag != "fortran"
  text = placed(before, before_at, marked) placed(code, at + 1, marked) placed(after, after_at, marked)
  if (tag == "fortran" && !is_program())
    text = "program block\nuse tarn_rvx\nimplicit none\n" text "end program\n"
  print text > (out "/" number "." (tag == "fortran" ? "f90" : tag))
  step("program", tag " " (how == "compile" ? "compile" : "run"))
  owner = at
}

# Ends the block whose comments and code have been read.
function finish_block(    compiled) {
  if (!have) return
  have = 0
  number++
  compiled = tag == "cpp" || tag == "c" || tag == "fortran"
  if (how == "from") {
    print code > (out "/" number ".from")
    step("from", argument)
    if (option == "run") write_program()
  } else if (how == "as") {
    print code > (out "/" number ".as")
    step("as", argument)
    if (compiled && is_program()) write_program()
  } else if (compiled) {
    if (tag == "fortran" || is_program()) write_program()
    else if (how == "compile") fail(at, "a fragment cannot be only compiled: write a whole program")
    else add_fragment()
  } else if (tag != "text") {
    print code > (out "/" number ".shown")
    print before code after > (out "/" number "." tag)
    step(tag, how == "run" ? "run" : "check")
    owner = at
  } else if (is_output) {
    print code > (out "/" number ".text")
    step("output", owner)
  }
  before = after = how = argument = option = ""
  is_output = 0
}

# Reads "block: HOW ARGUMENT" and sees that it fits anything.
function read_how(text,    words) {
  split(text, words, " ")
  how = words[1]
  argument = words[2]
  option = words[3]
  if (how !~ /^(run|from|as|compile|continue|file)$/) fail(FNR, "no such way with a block: " how)
  if (how ~ /^(from|as|compile)$/ && argument == "") fail(FNR, "\"" how "\" says not what or why")
  if (how != "compile" && option != "" && !(how == "from" && option == "run"))
    fail(FNR, "what is \"" option "\"?")
}

function check_fits() {
  if (how == "run" && tag != "sh" && tag != "cmake") fail(at, "\"run\" is for sh and cmake")
  if (how ~ /^(continue|file)$/ && tag != "cpp" && tag != "c") fail(at, "\"" how "\" is for cpp and c")
  if (how == "compile" && tag !~ /^(cpp|c|fortran)$/) fail(at, "\"compile\" is for programs")
  if (tag == "text" && (before != "" || how == "run")) fail(at, "text is not run")
  if (is_output && tag != "text") fail(at, "output is tagged text")
  if (is_output && owner == "") fail(at, "the output of no block")
}

function wanted() { return before != "" || how != "" || is_output }

BEGIN {
  ORS = ""
  print "" > (out "/steps")
}

comment != "" {
  if ($0 ~ /^ *-->$/) { comment = ""; next }
  if (comment == "before") before = before $0 "\n"
  else after = after $0 "\n"
  next
}

in_fence {
  if ($0 ~ /^ *```$/) { in_fence = 0; have = 1; next }
  line = $0
  for (i = 0; i < indent && substr(line, 1, 1) == " "; i++) line = substr(line, 2)
  code = code line "\n"
  next
}

/^ *<!-- before$/ { finish_block(); comment = "before"; before_at = FNR + 1; next }
/^ *<!-- after$/ {
  if (!have) fail(FNR, "\"after\" follows no block")
  comment = "after"; after_at = FNR + 1
  next
}
/^ *<!-- block: .* -->$/ {
  finish_block()
  text = $0
  sub(/^ *<!-- block: */, "", text)
  sub(/ *-->$/, "", text)
  read_how(text)
  next
}
/^ *<!-- output -->$/ { finish_block(); is_output = 1; next }
/^ *<!-- *(before|after|block|output)/ { fail(FNR, "a comment that steers a block is not written so"); next }

/^ *(```|~~~)/ {
  finish_block()
  match($0, /^ */)
  indent = RLENGTH
  tag = $0
  sub(/^ *(```|~~~)/, "", tag)
  at = FNR
  if ($0 ~ /~~~/ || tag !~ /^(cpp|c|fortran|cmake|sh|text)$/)
    fail(FNR, "a fence with the tag \"" tag "\": it has to be cpp, c, fortran, cmake, sh or text")
  check_fits()
  code = ""
  in_fence = 1
  next
}

/^[ \t]*$/ { blank = 1; next }

{
  if (wanted() && !have) fail(FNR, "no fence follows the comment above")
  if (blank && /^(    |\t)/ && !in_list) fail(FNR, "code by indentation: use a fence")
  if (/^[^ \t]/) in_list = /^([-*+]|[0-9]+\.) /
  blank = 0
}

END {
  if (in_fence || comment != "") fail(at, "not closed")
  if (wanted() && !have) fail(FNR, "no fence follows the last comment")
  finish_block()
  write_fragments()
  exit status
}
