# Tests of the sibling channels: envelopes, collision geometry, attractors and smoke settings.
ape_add_test(sibling_envelope_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/sibling_envelope_test.cpp
  LIBS ape_envelope_storage)
ape_add_test(sibling_collision_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/sibling_collision_test.cpp
  LIBS ape_collision_manager)
ape_add_test(sibling_collision_mesh_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/sibling_collision_mesh_test.cpp
  LIBS ape_collision_manager embree)
ape_add_test(sibling_attractor_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/sibling_attractor_test.cpp
  LIBS ape_attractor)
ape_add_test(sibling_smoke_settings_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/sibling_smoke_settings_test.cpp
  LIBS ape_smoke_settings)
# Loads the plug-ins by file; they must be built first.
ape_add_test(sibling_plugin_load_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/sibling_plugin_load_test.cpp
  LIBS ape_envelope_storage ape_collision_manager ape_attractor ape_smoke_settings)
