# Writes the manual pages quillane.1.gz and quillane-cli.1.gz from the
# programs' own --help, so that the manual says what the help says.
#
#   cmake -DQUILLANE=<program> -DCLI=<quillane-cli> -DOUT=<folder> -DVERSION=<x.y.z> -P manpages.cmake

cmake_minimum_required(VERSION 3.25)

# The output of a program run with the given arguments.
function(help_of out_var)
    execute_process(COMMAND ${ARGN} RESULT_VARIABLE status OUTPUT_VARIABLE text ERROR_VARIABLE error)
    if(NOT status EQUAL 0)
        message(FATAL_ERROR "${ARGN} failed: ${error}")
    endif()
    set(${out_var} "${text}" PARENT_SCOPE)
endfunction()

# Text kept as it is, line for line, in roff.
function(verbatim text out_var)
    string(REPLACE "\\" "\\e" text "${text}")
    string(REPLACE "-" "\\-" text "${text}")
    string(REGEX REPLACE "(^|\n)([.'])" "\\1\\\\&\\2" text "${text}")
    set(${out_var} ".nf\n${text}.fi\n" PARENT_SCOPE)
endfunction()

set(files [=[.SH FILES
.TP
.I names.mdb
in the program's folder (\fI/usr/lib/quillane/names.mdb\fR from the package,
\fIlib/quillane/names.mdb\fR below the prefix of an install of your own):
the names list, wherever it can be written.
.TP
.I $XDG_DATA_HOME/quillane/names.mdb
(\fI~/.local/share/quillane/names.mdb\fR when \fBXDG_DATA_HOME\fR is not set):
your own copy of the names list where the program's folder cannot be written,
as for the package, which installs it for every account. It is made from the
shipped list on first use; removing the package leaves it in place.
.TP
.I $XDG_CONFIG_HOME/Varnholt.ini
(\fI~/.config/Varnholt.ini\fR): the window's settings, section [Quillane].
.TP
.I $XDG_CACHE_HOME/quillane
(\fI~/.cache/quillane\fR): workbooks handed to the spreadsheet program; those
older than seven days are removed when a new one is made.
]=])

function(write_page name summary body)
    string(TOUPPER "${name}" title)
    string(REPLACE "-" "\\-" title "${title}")
    string(REPLACE "-" "\\-" shown "${name}")
    set(page ".TH ${title} 1 \"\" \"Quillane ${VERSION}\" \"User Commands\"\n")
    string(APPEND page ".SH NAME\n${shown} \\- ${summary}\n${body}${files}")
    file(WRITE "${OUT}/${name}.1" "${page}")
    # -n: no name or time in the header, so the same text gives the same file.
    execute_process(COMMAND gzip -9nf "${OUT}/${name}.1" RESULT_VARIABLE status)
    if(NOT status EQUAL 0)
        message(FATAL_ERROR "gzip failed on ${OUT}/${name}.1")
    endif()
endfunction()

file(MAKE_DIRECTORY "${OUT}")

help_of(help "${QUILLANE}" --help)
verbatim("${help}" text)
write_page(quillane "make lists of random personal names"
    ".SH SYNOPSIS\n.B quillane\n[\\fB\\-\\-database\\fR \\fIFILE\\fR]\n.SH DESCRIPTION\n${text}.SH SEE ALSO\n\\fBquillane\\-cli\\fR(1)\n")

help_of(help "${CLI}" --help)
verbatim("${help}" text)
set(body ".SH SYNOPSIS\n.B quillane\\-cli\n[\\fB\\-\\-database\\fR \\fIFILE\\fR] \\fICOMMAND\\fR [\\fIOPTIONS\\fR]\n")
string(APPEND body ".SH DESCRIPTION\n${text}.SH COMMANDS\n")
foreach(command generate names add delete clear import)
    help_of(help "${CLI}" ${command} --help)
    verbatim("${help}" text)
    string(APPEND body ".SS ${command}\n${text}")
endforeach()
string(APPEND body [=[.SH EXIT STATUS
0 when the command did its work, 1 when it failed (the reason is one line on
standard error), 2 when the command line was wrong. A failed command changes
nothing.
.SH SEE ALSO
\fBquillane\fR(1)
]=])
write_page(quillane-cli "random personal names for scripts and test data" "${body}")
