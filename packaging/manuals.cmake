# Manual pages and bash completion, made from what each program's --help says and from the documents.
set(manuals)
# manual(NAME SECTION COMPONENT MAKER SOURCE [ARGUMENT...]): the page that the script MAKER makes from the source.
function(manual name section component maker source)
  set(maker ${CMAKE_CURRENT_SOURCE_DIR}/manuals/${maker})
  set(page ${CMAKE_CURRENT_BINARY_DIR}/man/${name}.${section})
  add_custom_command(OUTPUT ${page}.gz COMMAND ${maker} ${source} ${ARGN} > ${page} COMMAND gzip -9nf ${page}
                     DEPENDS ${maker} ${source} VERBATIM)
  install(FILES ${page}.gz DESTINATION ${CMAKE_INSTALL_MANDIR}/man${section} COMPONENT ${component})
  set(manuals ${manuals} ${page}.gz PARENT_SCOPE)
endfunction()

file(MAKE_DIRECTORY ${CMAKE_CURRENT_BINARY_DIR}/man)
set(rows ${programs})
while(rows)
  list(POP_FRONT rows program component)
  set(file ${CMAKE_CURRENT_BINARY_DIR}/${program})
  if(TARGET ${program})
    set(file $<TARGET_FILE:${program}>)
  endif()
  manual(${program} 1 ${component} of-program ${file})
  # bash-completion's _longopt reads the options from --help.
  file(WRITE ${CMAKE_CURRENT_BINARY_DIR}/completions/${program} "complete -F _longopt ${program}\n")
  install(FILES ${CMAKE_CURRENT_BINARY_DIR}/completions/${program}
          DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions COMPONENT ${component})
endwhile()

# document_manual(DOCUMENT NAME SECTION COMPONENT)
function(document_manual document name section component)
  manual(${name} ${section} ${component} of-document ${PROJECT_SOURCE_DIR}/docs/${document} ${name} ${section}
         ${PROJECT_VERSION})
  set(manuals ${manuals} PARENT_SCOPE)
endfunction()
document_manual(virtual-card.md zarvo-virtual-card 7 zarvo-virtual-card)
document_manual(file-formats.md zarvo-recording 5 zarvo-tools)
add_custom_target(manuals ALL DEPENDS ${manuals})
