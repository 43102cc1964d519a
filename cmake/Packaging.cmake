# What `cmake --install` puts in place and what `cpack -G DEB` packs: the two programs, the
# desktop entry and icon, and the user guide.
include(GNUInstallDirs)

install(TARGETS qengui qensim RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})
install(FILES ${PROJECT_SOURCE_DIR}/packaging/qengui.desktop DESTINATION ${CMAKE_INSTALL_DATADIR}/applications)
install(FILES ${PROJECT_SOURCE_DIR}/packaging/qengui.svg DESTINATION ${CMAKE_INSTALL_DATADIR}/icons/hicolor/scalable/apps)
install(FILES ${PROJECT_SOURCE_DIR}/README.md DESTINATION ${CMAKE_INSTALL_DOCDIR})
install(DIRECTORY ${PROJECT_SOURCE_DIR}/docs/guide ${PROJECT_SOURCE_DIR}/docs/images DESTINATION ${CMAKE_INSTALL_DOCDIR})

set(CPACK_PACKAGE_NAME qengui)
set(CPACK_PACKAGE_VENDOR "Corvane")
set(CPACK_PACKAGE_CONTACT "Corvane qengui developers <qengui@corvane.invalid>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "User software of the Corvane 71300 pattern generator and error analyser")
set(CPACK_PACKAGE_DESCRIPTION
    "qengui shows the instrument's editors and windows and keeps them in step with the instrument server; qensim simulates the server.")
set(CPACK_STRIP_FILES ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION electronics)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
include(CPack)
