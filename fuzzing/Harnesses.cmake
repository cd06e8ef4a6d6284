# The harnesses of fuzzing/harness/ as "<harness>=<libraries>" ("+" between
# several libraries). Shared by fuzzing/CMakeLists.txt (the fuzzers) and
# tests/unit/fuzz_replay (the seed replay in the normal build).
set(MV_FUZZ_HARNESSES
  "link_text=mv_addon_objects"
  "trade_data=mv_data"
  "number_text=mv_data"
  "watchlist_xml=term_host"
  "summary_page=mv_addon_objects"
  "cell_decode=mv_data+HostView"
  "watchlist_params=mv_addon_objects"
  "watchlist_text=term_host"
  "view_price=mv_test_support"
  "view_depth=mv_test_support"
  "view_sales=mv_test_support"
  "view_summary=mv_test_support"
  "view_new_alert=mv_test_support"
  "view_alert_list=mv_test_support"
)

# mv_fuzz_harness(<entry> <harness-var> <libs-var>)
function(mv_fuzz_harness entry harness_var libs_var)
  string(REPLACE "=" ";" parts "${entry}")
  list(GET parts 0 harness)
  list(GET parts 1 libs)
  string(REPLACE "+" ";" libs "${libs}")
  set(${harness_var} ${harness} PARENT_SCOPE)
  set(${libs_var} ${libs} PARENT_SCOPE)
endfunction()
