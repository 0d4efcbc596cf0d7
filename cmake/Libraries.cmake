# A library of the project: shared and static of one set of objects, installed with what CMake and pkg-config need to
# find them. TARGETS and OPTIONS: what users of the static library link besides, for CMake and for pkg-config.
include(CMakePackageConfigHelpers)

set(pelm_package_folder ${CMAKE_INSTALL_LIBDIR}/cmake/PelmImageDecoder)

function(pelm_library name description objects)
  cmake_parse_arguments(arg "" "" "TARGETS;OPTIONS" ${ARGN})
  add_library(${name} SHARED)
  add_library(${name}Static STATIC)
  foreach(library ${name} ${name}Static)
    target_link_libraries(${library} PRIVATE $<BUILD_INTERFACE:${objects}> ${arg_TARGETS})
    target_include_directories(${library} INTERFACE $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>
                                                    $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
    set_target_properties(${library} PROPERTIES OUTPUT_NAME ${name} LINKER_LANGUAGE C)
  endforeach()
  # CMake names the C++ runtime too; nothing of it is used, so nothing of it is asked for at load time.
  target_link_options(${name} PRIVATE LINKER:--as-needed)
  set_target_properties(${name} PROPERTIES VERSION ${PELM_ABI}.${PROJECT_VERSION_MINOR}.${PROJECT_VERSION_PATCH}
                                           SOVERSION ${PELM_ABI})
  install(TARGETS ${name} ${name}Static EXPORT PelmImageDecoder)

  # Found from where the file lies, so that what was installed may be moved; but for folders that are fixed.
  set(prefix ${CMAKE_INSTALL_PREFIX})
  if(NOT IS_ABSOLUTE ${CMAKE_INSTALL_LIBDIR})
    file(RELATIVE_PATH up /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
    set(prefix \${pcfiledir}/${up})
  endif()
  set(libdir \${prefix}/${CMAKE_INSTALL_LIBDIR})
  if(IS_ABSOLUTE ${CMAKE_INSTALL_LIBDIR})
    set(libdir ${CMAKE_INSTALL_LIBDIR})
  endif()
  set(includedir \${prefix}/${CMAKE_INSTALL_INCLUDEDIR})
  if(IS_ABSOLUTE ${CMAKE_INSTALL_INCLUDEDIR})
    set(includedir ${CMAKE_INSTALL_INCLUDEDIR})
  endif()
  list(JOIN arg_OPTIONS " " private)
  configure_file(${PROJECT_SOURCE_DIR}/cmake/library.pc.in ${PROJECT_BINARY_DIR}/${name}.pc @ONLY)
  install(FILES ${PROJECT_BINARY_DIR}/${name}.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
endfunction()

# Once, when all of them are there.
function(pelm_install_package)
  install(FILES ${PROJECT_SOURCE_DIR}/include/PelmAnimation.h ${PROJECT_SOURCE_DIR}/include/PelmHost.h
                ${PROJECT_SOURCE_DIR}/include/PelmHostTesting.h ${PROJECT_SOURCE_DIR}/include/PelmImageDecoder.h
          TYPE INCLUDE)
  install(EXPORT PelmImageDecoder NAMESPACE Pelm:: FILE PelmImageDecoderTargets.cmake
          DESTINATION ${pelm_package_folder})
  write_basic_package_version_file(${PROJECT_BINARY_DIR}/PelmImageDecoderConfigVersion.cmake
                                   COMPATIBILITY SameMinorVersion)
  install(FILES ${PROJECT_SOURCE_DIR}/cmake/PelmImageDecoderConfig.cmake
                ${PROJECT_BINARY_DIR}/PelmImageDecoderConfigVersion.cmake
          DESTINATION ${pelm_package_folder})
endfunction()
