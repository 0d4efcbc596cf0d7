# find_package(PelmImageDecoder): Pelm::PelmImageDecoder, Pelm::PelmHost and Pelm::PelmHostTesting, and the static ones,
# which end in Static. A program links the decoder and one host, or brings the host's services itself.
include(CMakeFindDependencyMacro)
find_dependency(Threads)
include(${CMAKE_CURRENT_LIST_DIR}/PelmImageDecoderTargets.cmake)

# CMake takes the static libraries for C++; nothing of its runtime is used, and C programs need no C++ compiler.
foreach(library PelmImageDecoder PelmHost PelmHostTesting)
  get_target_property(configurations Pelm::${library}Static IMPORTED_CONFIGURATIONS)
  foreach(configuration IN LISTS configurations)
    set_target_properties(Pelm::${library}Static PROPERTIES IMPORTED_LINK_INTERFACE_LANGUAGES_${configuration} C)
  endforeach()
endforeach()
