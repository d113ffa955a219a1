# Makes the source file that holds the page of a report, for ReportPage.h.
#   cmake -DPAGE=DIRECTORY -DOUTPUT=FILE -P EmbedPage.cmake
# The scripts are put one after the other in this order; the last one starts the page.
set(scripts values filter parts pairing accounts rows stages overview report)

file(READ ${PAGE}/report.html page)
file(READ ${PAGE}/report.css style)
string(REPLACE "{{style}}" "${style}" page "${page}")
set(script "")
foreach(name IN LISTS scripts)
  file(READ ${PAGE}/${name}.js text)
  string(APPEND script "${text}")
endforeach()
string(REPLACE "{{script}}" "${script}" page "${page}")

set(place "{{report}}")
string(FIND "${page}" "${place}" start)
string(LENGTH "${place}" length)
math(EXPR end "${start} + ${length}")
string(SUBSTRING "${page}" 0 ${start} before)
string(SUBSTRING "${page}" ${end} -1 after)

file(WRITE ${OUTPUT} "#include \"report/ReportPage.h\"

namespace accounts {

const ReportPage reportPage = {R\"page(${before})page\",
                               R\"page(${after})page\"};

}  // namespace accounts
")
