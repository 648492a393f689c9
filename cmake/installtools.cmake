# The programs under tools/, with manual pages and completions made from their --help, and files for desktops that open
# scenes and show thumbnails.
install(TARGETS orv_convert orv_view orv_inspect RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT tools)

set(made "")
foreach(program convert view inspect)
    set(name orv-${program})
    set(folder ${CMAKE_CURRENT_BINARY_DIR}/manuals/${name})
    file(MAKE_DIRECTORY ${folder})
    add_custom_command(OUTPUT ${folder}/${name}.1 ${folder}/${name} ${folder}/_${name} ${folder}/${name}.fish
        COMMAND orv_${program} --manual > ${folder}/${name}.1
        COMMAND orv_${program} --completion bash > ${folder}/${name}
        COMMAND orv_${program} --completion zsh > ${folder}/_${name}
        COMMAND orv_${program} --completion fish > ${folder}/${name}.fish
        DEPENDS orv_${program} VERBATIM COMMENT "Asking ${name} for its manual page")
    list(APPEND made ${folder}/${name}.1)
    install(FILES ${folder}/${name}.1 DESTINATION ${CMAKE_INSTALL_MANDIR}/man1 COMPONENT tools)
    install(FILES ${folder}/${name} DESTINATION share/bash-completion/completions COMPONENT tools)
    install(FILES ${folder}/_${name} DESTINATION share/zsh/vendor-completions COMPONENT tools)
    install(FILES ${folder}/${name}.fish DESTINATION share/fish/vendor_completions.d COMPONENT tools)
endforeach()
add_custom_target(orv_manuals ALL DEPENDS ${made})

set(desktop tools/view/desktop)
install(FILES ${desktop}/orv-view.desktop DESTINATION share/applications COMPONENT tools)
install(FILES ${desktop}/orv-view.thumbnailer DESTINATION share/thumbnailers COMPONENT tools)
install(FILES ${desktop}/orv.xml DESTINATION share/mime/packages COMPONENT tools)
install(FILES cmake/copyright DESTINATION share/doc/orv-tools COMPONENT tools)

# The page for orv-convert --page, if ./run web has built it.
install(DIRECTORY build/web/page/ DESTINATION share/orv/web COMPONENT tools OPTIONAL)
