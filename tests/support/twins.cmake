# Writes a header that gives the twins of both precisions, as the public headers declare them, one
# name in the tests. Functions that take no record and no scalar are the same in both.
set(twins)
set(declared)
foreach(header IN LISTS WAVKIT_HEADERS)
  file(STRINGS ${header} prototypes REGEX "^WAVKIT_API .*[ *]dsp[a-z0-9_]+\\(")
  list(TRANSFORM prototypes REPLACE "^.*[ *](dsp[a-z0-9_]+)\\(.*" "\"\\1\"")
  list(APPEND declared ${prototypes})
  file(STRINGS ${header} singles REGEX "^WAVKIT_API int dspf.*\\(.*(dspf|float)")
  list(TRANSFORM singles REPLACE "^WAVKIT_API int dspf([a-z0-9_]+)\\(.*" "\\1")
  list(APPEND twins ${singles})
endforeach()
list(TRANSFORM twins REPLACE "(.+)" "TWINS(dsp\\1, dspf\\1)" OUTPUT_VARIABLE definitions)
# Of those to be visited, those that begin and end what records and the library hold are left out.
list(FILTER twins EXCLUDE REGEX "_(init|alloc|realloc|destroy|lib_.*)$")
list(TRANSFORM twins REPLACE "(.+)" "    visit(dsp\\1)" OUTPUT_VARIABLE visits)
list(JOIN definitions "\n" definitions)
list(JOIN visits ";\n" visits)
list(JOIN declared ", " declared)
file(CONFIGURE OUTPUT ${CMAKE_CURRENT_BINARY_DIR}/support/twins.hpp CONTENT
"#define TWINS(of_double, of_single) \\
    inline constexpr Twins of_double{#of_double, ::of_double, ::of_single};
${definitions}
template <class Visit>
void each_function(Visit visit) {
${visits};
}
inline constexpr const char* declared[] = {${declared}};
")
set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${WAVKIT_HEADERS})
