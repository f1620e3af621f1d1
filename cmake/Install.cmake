# `cmake --install`: the suite's layout under the prefix.
#   exe/linux/restzones, exe/linux/zonetool  the programs
#   bin/restzones, bin/zonetool              links to them
#   config/environ.cfg                       sets ?TXT to the message files below
#   text/textg.fr, text/textg.en             the message files (line 139: the banner)
# The programs live in exe/linux/ because that is where the runtime finds its
# installation home when KVLHOME is not set (the directory above exe/); a
# program started through a link in bin/ finds it too, since the runtime reads
# the path of the running executable, links resolved. The installed program
# then needs only the suite's variables (KVLTMPDIR or KVLTMP/KVLZONE/KVLCONF,
# KVLLANG); TXTPATH or a suite's own KVLHOME still take precedence.
if(TARGET restzones)
  install(TARGETS restzones RUNTIME DESTINATION exe/linux)
endif()
install(TARGETS zonetool RUNTIME DESTINATION exe/linux)
install(FILES ${PROJECT_SOURCE_DIR}/cmake/environ.cfg DESTINATION config)
install(FILES ${PROJECT_SOURCE_DIR}/examples/pocket/textg.fr ${PROJECT_SOURCE_DIR}/examples/pocket/textg.en
        DESTINATION text)
install(CODE [[
  set(zt_bin "$ENV{DESTDIR}${CMAKE_INSTALL_PREFIX}/bin")
  file(MAKE_DIRECTORY "${zt_bin}")
  foreach(zt_program restzones zonetool)
    message(STATUS "Installing: ${zt_bin}/${zt_program} -> ../exe/linux/${zt_program}")
    file(REMOVE "${zt_bin}/${zt_program}")
    file(CREATE_LINK "../exe/linux/${zt_program}" "${zt_bin}/${zt_program}" SYMBOLIC)
  endforeach()
]])
