# The sources of the preset and package formats, which know nothing else of the library: for the tools and the fuzzers, which compile
# them in.
set(VXCOMN_PRESET_FORMATS
    platform/text.cpp
    preset/byte_cursor.cpp
    preset/endpoint_id.cpp
    preset/engine_identity.cpp
    preset/package_maps.cpp
    preset/package_reader.cpp
    preset/package_writer.cpp
    preset/preset_names.cpp
    preset/preset_reader.cpp
    preset/preset_writer.cpp
    preset/sha256.cpp
    preset/zip_directory.cpp)
