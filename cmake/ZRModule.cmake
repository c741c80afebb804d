# zr_add_module(NAME SOURCE): an acceleration module NAME.ZNX, a plain shared object that links with nothing.
function(zr_add_module name source)
  add_library(${name} MODULE ${source})
  target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR}/include)
  target_link_libraries(${name} PRIVATE zr_rules)
  set_target_properties(${name} PROPERTIES PREFIX "" SUFFIX ".ZNX" C_VISIBILITY_PRESET hidden)
endfunction()
