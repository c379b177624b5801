# Generates the rule tables and the descriptor tables from the protocol
# description at build time. Everything under grammar/ and generator/ is a
# dependency, so an edit of the description rebuilds what follows from it.
set(RNSAP_GENERATED_DIR ${CMAKE_BINARY_DIR}/generated)
set(RNSAP_GRAMMAR_DIR ${CMAKE_SOURCE_DIR}/grammar CACHE PATH "The protocol description")
file(GLOB_RECURSE RNSAP_GRAMMAR_FILES CONFIGURE_DEPENDS ${RNSAP_GRAMMAR_DIR}/*.rg)
file(GLOB RNSAP_GENERATOR_FILES CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/generator/*.py)
# The message generator is no input of the tables.
set(RNSAP_MESSAGE_GENERATOR ${CMAKE_SOURCE_DIR}/generator/message_gen.py)
list(REMOVE_ITEM RNSAP_GENERATOR_FILES ${RNSAP_MESSAGE_GENERATOR})
set(RNSAP_GENERATED_SOURCES
  ${RNSAP_GENERATED_DIR}/grammar_program.cpp
  ${RNSAP_GENERATED_DIR}/descriptor_tables.cpp)
set(RNSAP_GENERATED_HEADERS
  ${RNSAP_GENERATED_DIR}/grammar_constants.h
  ${RNSAP_GENERATED_DIR}/grammar_walk.h
  ${RNSAP_GENERATED_DIR}/key_field_rows.h)
add_custom_command(
  OUTPUT ${RNSAP_GENERATED_SOURCES} ${RNSAP_GENERATED_HEADERS}
  COMMAND ${Python3_EXECUTABLE} ${CMAKE_SOURCE_DIR}/generator/rnsap_gen.py
          --out ${RNSAP_GENERATED_DIR} ${RNSAP_GRAMMAR_DIR}
  DEPENDS ${RNSAP_GRAMMAR_FILES} ${RNSAP_GENERATOR_FILES}
  COMMENT "Generating grammar and descriptor tables from the protocol description"
  VERBATIM)
add_custom_target(rnsap_generated DEPENDS ${RNSAP_GENERATED_SOURCES} ${RNSAP_GENERATED_HEADERS})

# Messages generated from the description, each with the walk the decoder
# must make of it, for the tests.
set(RNSAP_MESSAGE_CORPUS ${RNSAP_GENERATED_DIR}/generated_messages.txt)
add_custom_command(
  OUTPUT ${RNSAP_MESSAGE_CORPUS}
  COMMAND ${Python3_EXECUTABLE} ${CMAKE_SOURCE_DIR}/generator/message_gen.py
          --seed 1 --out ${RNSAP_MESSAGE_CORPUS} ${RNSAP_GRAMMAR_DIR}
  DEPENDS ${RNSAP_GRAMMAR_FILES} ${RNSAP_GENERATOR_FILES} ${RNSAP_MESSAGE_GENERATOR}
  COMMENT "Generating messages from the protocol description"
  VERBATIM)
add_custom_target(rnsap_message_corpus DEPENDS ${RNSAP_MESSAGE_CORPUS})
