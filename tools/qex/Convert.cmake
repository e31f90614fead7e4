# What the verbs share, the pictures, the textures and the converter of the qex command, as static libraries.
find_package(assimp REQUIRED)
find_package(CLI11 REQUIRED)
find_package(nlohmann_json REQUIRED)
find_path(ETC1_INCLUDE_DIR ETC1/etc1.h PATH_SUFFIXES android REQUIRED)
find_library(ETC1_LIBRARY ETC1 PATH_SUFFIXES android REQUIRED)
find_path(STB_INCLUDE_DIR stb/stb_image.h REQUIRED)

add_library(qex_command STATIC ${CMAKE_CURRENT_LIST_DIR}/CommandLine.cpp
    ${CMAKE_CURRENT_LIST_DIR}/OutputFile.cpp)
target_include_directories(qex_command PUBLIC ${CMAKE_CURRENT_LIST_DIR})
target_link_libraries(qex_command PUBLIC CLI11::CLI11 PRIVATE qex_warnings)

add_library(qex_image STATIC ${CMAKE_CURRENT_LIST_DIR}/ImageFile.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ImageFileStb.cpp)
set_source_files_properties(${CMAKE_CURRENT_LIST_DIR}/ImageFileStb.cpp PROPERTIES
    # Its JPEG writer shifts negative numbers to the left, as all compilers allow.
    COMPILE_OPTIONS "-w;-fno-sanitize=shift")
target_include_directories(qex_image PUBLIC ${CMAKE_CURRENT_LIST_DIR})
target_include_directories(qex_image SYSTEM PRIVATE ${STB_INCLUDE_DIR})
target_link_libraries(qex_image PUBLIC qex_command PRIVATE qex_warnings)

add_library(qex_texture STATIC
    ${CMAKE_CURRENT_LIST_DIR}/TextureCommand.cpp
    ${CMAKE_CURRENT_LIST_DIR}/TextureContainer.cpp
    ${CMAKE_CURRENT_LIST_DIR}/TextureFiles.cpp
    ${CMAKE_CURRENT_LIST_DIR}/TextureFormats.cpp
    ${CMAKE_CURRENT_LIST_DIR}/TextureKtx.cpp
    ${CMAKE_CURRENT_LIST_DIR}/TextureOverrides.cpp
    ${CMAKE_CURRENT_LIST_DIR}/TexturePvr.cpp
    ${CMAKE_CURRENT_LIST_DIR}/TextureWrite.cpp)
target_include_directories(qex_texture PUBLIC ${CMAKE_CURRENT_LIST_DIR})
target_include_directories(qex_texture SYSTEM PRIVATE ${ETC1_INCLUDE_DIR})
target_link_libraries(qex_texture PUBLIC qex_podwriter qex_image PRIVATE ${ETC1_LIBRARY} qex_engine qex_warnings)

add_library(qex_convert STATIC
    ${CMAKE_CURRENT_LIST_DIR}/ConvertAnimation.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertBatches.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertColours.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertCommand.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertGltf.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertMaterials.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertMeshes.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertNodes.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertPlacement.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertProcess.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertScene.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertSkin.cpp
    ${CMAKE_CURRENT_LIST_DIR}/ConvertTextures.cpp
    ${CMAKE_CURRENT_LIST_DIR}/EngineOutput.cpp
    ${CMAKE_CURRENT_LIST_DIR}/SceneBounds.cpp)
target_include_directories(qex_convert PUBLIC ${CMAKE_CURRENT_LIST_DIR})
target_link_libraries(qex_convert PUBLIC qex_texture assimp::assimp PRIVATE
    CLI11::CLI11 nlohmann_json::nlohmann_json qex_engine qex_warnings)
