# Writes a header that gives the twins of both precisions, as the public headers declare them, one
# name in the tests. Functions that take no record and no scalar are the same in both.
set(twins)
foreach(header IN LISTS WAVKIT_HEADERS)
  file(STRINGS ${header} singles REGEX "^WAVKIT_API int dspf.*\\(.*(dspf|float)")
  list(TRANSFORM singles REPLACE "^WAVKIT_API int dspf([a-z0-9_]+)\\(.*" "\\1")
  list(APPEND twins ${singles})
endforeach()
list(TRANSFORM twins REPLACE "(.+)" "TWINS(dsp\\1, dspf\\1)" OUTPUT_VARIABLE definitions)
# In the list of them, those that begin and end what records and the library hold are left out.
list(FILTER twins EXCLUDE REGEX "_(init|alloc|realloc|destroy|lib_.*)$")
list(TRANSFORM twins PREPEND "dsp" OUTPUT_VARIABLE names)
list(JOIN definitions "\n" definitions)
list(JOIN names ", " names)
file(CONFIGURE OUTPUT ${CMAKE_CURRENT_BINARY_DIR}/support/twins.hpp CONTENT
"#define TWINS(of_double, of_single) \\
    inline constexpr Twins of_double{#of_double, ::of_double, ::of_single};
${definitions}
inline constexpr std::tuple every_function{${names}};
")
set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${WAVKIT_HEADERS})
