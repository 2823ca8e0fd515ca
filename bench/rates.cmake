# Changes of the sampling rate, as the program makes them, beside soxr and libsamplerate.
pkg_check_modules(SOXR REQUIRED IMPORTED_TARGET soxr)
pkg_check_modules(SAMPLERATE REQUIRED IMPORTED_TARGET samplerate)

set(tools ${PROJECT_SOURCE_DIR}/tools)
add_executable(bench_rates rates.cpp ${tools}/measure/rate_change.cpp
  ${tools}/measure/rate_stages.cpp ${tools}/base/signal.cpp)
target_include_directories(bench_rates PRIVATE ${tools})
target_link_libraries(bench_rates PRIVATE
  wavkit wavkit_options PkgConfig::SOXR PkgConfig::SAMPLERATE)
