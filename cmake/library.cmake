# The library: one shared object, a static one on request, both from the same objects.
file(GLOB_RECURSE WAVKIT_SOURCES CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/src/*.cpp)
file(GLOB WAVKIT_HEADERS CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/include/wavkit/*.h)

include(cmake/sets.cmake)
set(WAVKIT_GENERATED ${PROJECT_BINARY_DIR}/generated)
wavkit_write_sets("${WAVKIT_HEADERS}" ${WAVKIT_GENERATED})
set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${WAVKIT_HEADERS})

if(CMAKE_SYSTEM_PROCESSOR MATCHES "^(i.86|x86.*|AMD64)$" AND CMAKE_SIZEOF_VOID_P EQUAL 4)
  # Each step rounded as it is stated, not as the registers of the x87 have it.
  target_compile_options(wavkit_options INTERFACE -msse2 -mfpmath=sse)
endif()
if(CMAKE_SIZEOF_VOID_P EQUAL 4)
  target_compile_definitions(wavkit_options INTERFACE _FILE_OFFSET_BITS=64)
endif()

# Objects of the library, for every processor of the target or for those of one instruction set.
function(wavkit_add_objects name)
  add_library(${name} OBJECT ${ARGN})
  target_include_directories(${name} PUBLIC ${PROJECT_SOURCE_DIR}/include
    PRIVATE ${PROJECT_SOURCE_DIR}/src ${WAVKIT_GENERATED})
  target_compile_definitions(${name} PRIVATE WAVKIT_BUILDING)
  # Products and sums are not fused behind the back of what stands on exact steps.
  target_compile_options(${name} PRIVATE -fno-exceptions -fno-math-errno -fno-trapping-math
    -ffp-contract=off -Wno-psabi $<$<CONFIG:Release>:-O3>)
  set_target_properties(${name} PROPERTIES
    CXX_VISIBILITY_PRESET hidden VISIBILITY_INLINES_HIDDEN ON)
  target_link_libraries(${name} PRIVATE wavkit_options)
endfunction()

# The functions of the standard library that are not inlined have one name in all sets, of which
# the linker takes the first: the plainest set comes first.
set(entries ${PROJECT_SOURCE_DIR}/src/kernel/entries.cpp)
list(REMOVE_ITEM WAVKIT_SOURCES ${entries})
wavkit_add_objects(wavkit_entries ${entries})
set(WAVKIT_OBJECTS $<TARGET_OBJECTS:wavkit_entries>)
# Transforms are only the better for fused products and sums.
file(GLOB fused ${PROJECT_SOURCE_DIR}/src/transform/*.cpp)
set_source_files_properties(${fused} PROPERTIES COMPILE_OPTIONS -ffp-contract=fast)
# GCC's vectoriser fuses complex products all the same, and what is left beside its vectors not:
# where the last bit must not depend on where samples lie, loops over them are not for it.
foreach(topic filter/direct polynomial/all_roots math/combine)
  set_source_files_properties(${PROJECT_SOURCE_DIR}/src/${topic}.cpp PROPERTIES COMPILE_OPTIONS
    -fno-tree-vectorize)
endforeach()
foreach(set IN LISTS WAVKIT_SETS)
  wavkit_add_objects(wavkit_${set} ${WAVKIT_SOURCES})
  target_compile_definitions(wavkit_${set} PRIVATE WAVKIT_SET=${set})
  target_compile_options(wavkit_${set} PRIVATE ${WAVKIT_SET_OPTIONS_${set}}
    -include ${WAVKIT_GENERATED}/names_${set}.h)
  list(APPEND WAVKIT_OBJECTS $<TARGET_OBJECTS:wavkit_${set}>)
endforeach()

add_library(wavkit SHARED ${WAVKIT_OBJECTS})
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
  add_library(wavkit_static STATIC ${WAVKIT_OBJECTS})
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
