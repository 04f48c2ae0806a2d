# The header-only libraries of the tools and tests (CLI11, nlohmann JSON, doctest). The system's include folder must never get on
# the cross compiler's path, so a folder of links to just these stands in for it.
set(VXCOMN_HEADER_ONLY ${CMAKE_BINARY_DIR}/header-only)
file(MAKE_DIRECTORY ${VXCOMN_HEADER_ONLY})
foreach(package CLI nlohmann doctest)
    if(NOT EXISTS /usr/include/${package})
        message(FATAL_ERROR "The headers of '${package}' are missing: run scripts/setup.")
    endif()
    file(CREATE_LINK /usr/include/${package} ${VXCOMN_HEADER_ONLY}/${package} SYMBOLIC)
endforeach()
add_library(vxcomn_header_only INTERFACE)
target_include_directories(vxcomn_header_only SYSTEM INTERFACE ${VXCOMN_HEADER_ONLY})
