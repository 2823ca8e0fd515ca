# The library: one shared object, a static one on request, both from the same objects.
file(GLOB_RECURSE WAVKIT_SOURCES CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/src/*.cpp)
file(GLOB WAVKIT_HEADERS CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/include/wavkit/*.h)

# The kernels' widths are the compiler's vector extension; x86 processors get them in three forms.
set(kernels ${PROJECT_SOURCE_DIR}/src/kernel)
foreach(family fft convolve)
  set_source_files_properties(${kernels}/${family}_baseline.cpp ${kernels}/${family}_avx2.cpp
    ${kernels}/${family}_avx512.cpp PROPERTIES COMPILE_OPTIONS "-Wno-psabi;-ffp-contract=fast")
  if(CMAKE_SYSTEM_PROCESSOR MATCHES "x86_64|AMD64")
    set_property(SOURCE ${kernels}/${family}_avx2.cpp APPEND PROPERTY COMPILE_OPTIONS -mavx2 -mfma)
    set_property(SOURCE ${kernels}/${family}_avx512.cpp APPEND PROPERTY COMPILE_OPTIONS
      -mavx512f -mavx512dq -mavx512vl -mfma)
  endif()
endforeach()
if(CMAKE_SYSTEM_PROCESSOR MATCHES "x86_64|AMD64")
  set_source_files_properties(${kernels}/dispatch.cpp PROPERTIES
    COMPILE_DEFINITIONS WAVKIT_X86_KERNELS)
else()
  list(FILTER WAVKIT_SOURCES EXCLUDE REGEX "src/kernel/.*_avx(2|512)\\.cpp$")
endif()

add_library(wavkit_objects OBJECT ${WAVKIT_SOURCES})
target_include_directories(wavkit_objects
  PUBLIC ${PROJECT_SOURCE_DIR}/include PRIVATE ${PROJECT_SOURCE_DIR}/src)
target_compile_definitions(wavkit_objects PRIVATE WAVKIT_BUILDING)
target_compile_options(wavkit_objects PRIVATE -fno-exceptions -fno-math-errno -fno-trapping-math
                       -fno-semantic-interposition $<$<CONFIG:Release>:-O3>)
set_target_properties(wavkit_objects PROPERTIES
  CXX_VISIBILITY_PRESET hidden VISIBILITY_INLINES_HIDDEN ON)
target_link_libraries(wavkit_objects PRIVATE wavkit_options)

add_library(wavkit SHARED $<TARGET_OBJECTS:wavkit_objects>)
set_target_properties(wavkit PROPERTIES VERSION ${PROJECT_VERSION} SOVERSION 2)
target_link_libraries(wavkit PRIVATE wavkit_options)
target_link_options(wavkit PRIVATE
  -Wl,--version-script=${PROJECT_SOURCE_DIR}/cmake/exports.map)
if(NOT WAVKIT_SANITIZE)
  target_link_options(wavkit PRIVATE -Wl,--no-undefined)
endif()
set_property(TARGET wavkit APPEND PROPERTY LINK_DEPENDS ${PROJECT_SOURCE_DIR}/cmake/exports.map)
set(WAVKIT_TARGETS wavkit)

# What a C compiler does not link by itself: the C++ runtime and what that needs.
set(WAVKIT_RUNTIME ${CMAKE_CXX_IMPLICIT_LINK_LIBRARIES})
list(REMOVE_ITEM WAVKIT_RUNTIME ${CMAKE_C_IMPLICIT_LINK_LIBRARIES})
list(TRANSFORM WAVKIT_RUNTIME PREPEND "-l" OUTPUT_VARIABLE WAVKIT_PC_RUNTIME)
list(JOIN WAVKIT_PC_RUNTIME " " WAVKIT_PC_RUNTIME)
if(WAVKIT_STATIC)
  add_library(wavkit_static STATIC $<TARGET_OBJECTS:wavkit_objects>)
  set_target_properties(wavkit_static PROPERTIES OUTPUT_NAME wavkit EXPORT_NAME wavkit_static)
  target_compile_definitions(wavkit_static INTERFACE WAVKIT_STATIC)
  target_link_libraries(wavkit_static INTERFACE ${WAVKIT_RUNTIME})
  list(APPEND WAVKIT_TARGETS wavkit_static)
endif()

foreach(target IN LISTS WAVKIT_TARGETS)
  target_include_directories(${target} INTERFACE
    $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>
    $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
endforeach()
add_library(wavkit::wavkit ALIAS wavkit)

install(TARGETS ${WAVKIT_TARGETS} EXPORT wavkit-targets)
install(FILES ${WAVKIT_HEADERS} DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/wavkit)
install(EXPORT wavkit-targets NAMESPACE wavkit::
        DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/wavkit)
configure_package_config_file(${PROJECT_SOURCE_DIR}/cmake/wavkit-config.cmake.in
  ${PROJECT_BINARY_DIR}/wavkit-config.cmake
  INSTALL_DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/wavkit)
write_basic_package_version_file(${PROJECT_BINARY_DIR}/wavkit-config-version.cmake
  COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/wavkit-config.cmake
              ${PROJECT_BINARY_DIR}/wavkit-config-version.cmake
        DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/wavkit)
# Relative to where it lies, so that any --prefix will do.
file(RELATIVE_PATH WAVKIT_PC_TO_PREFIX /prefix/${CMAKE_INSTALL_LIBDIR}/pkgconfig /prefix)
configure_file(${PROJECT_SOURCE_DIR}/cmake/wavkit.pc.in ${PROJECT_BINARY_DIR}/wavkit.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/wavkit.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
