# What `cmake --install` lays down: library, import library and .def file, headers, tool.
install(TARGETS ZqVisSvc RUNTIME DESTINATION bin LIBRARY DESTINATION lib ARCHIVE DESTINATION lib)
install(DIRECTORY include/zqvissvc DESTINATION include FILES_MATCHING PATTERN "*.h")
install(FILES README.md DESTINATION .)
set_target_properties(zqvis PROPERTIES INSTALL_RPATH "$ORIGIN/../lib")
install(TARGETS zqvis RUNTIME DESTINATION bin)
if(WIN32)
  install(FILES ${PROJECT_BINARY_DIR}/generated/ZqVisSvc.def DESTINATION lib)
endif()
