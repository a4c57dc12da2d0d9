// Another libjpeg, as an application may have loaded one: under the classic names, in front of
// every other library, and of no use to anybody. It counts who takes it for the right one.

// Seen from outside, as those of a real one are. Without their parameters: whoever calls these has
// the wrong function anyway.
#pragma GCC visibility push(default)
extern "C" {

int rivalCalls = 0;

#define RIVAL(name) \
  void* name() {    \
    ++rivalCalls;   \
    return nullptr; \
  }

RIVAL(jpeg_CreateCompress)
RIVAL(jpeg_CreateDecompress)
RIVAL(jpeg_abort)
RIVAL(jpeg_abort_compress)
RIVAL(jpeg_abort_decompress)
RIVAL(jpeg_alloc_huff_table)
RIVAL(jpeg_alloc_quant_table)
RIVAL(jpeg_calc_output_dimensions)
RIVAL(jpeg_consume_input)
RIVAL(jpeg_core_output_dimensions)
RIVAL(jpeg_destroy)
RIVAL(jpeg_destroy_compress)
RIVAL(jpeg_destroy_decompress)
RIVAL(jpeg_finish_decompress)
RIVAL(jpeg_free_large)
RIVAL(jpeg_free_small)
RIVAL(jpeg_get_large)
RIVAL(jpeg_get_small)
RIVAL(jpeg_has_multiple_scans)
RIVAL(jpeg_input_complete)
RIVAL(jpeg_mem_available)
RIVAL(jpeg_mem_init)
RIVAL(jpeg_mem_src)
RIVAL(jpeg_mem_term)
RIVAL(jpeg_read_header)
RIVAL(jpeg_read_scanlines)
RIVAL(jpeg_resync_to_restart)
RIVAL(jpeg_save_markers)
RIVAL(jpeg_set_marker_processor)
RIVAL(jpeg_start_decompress)
RIVAL(jpeg_std_error)
RIVAL(jinit_marker_reader)
RIVAL(jinit_master_decompress)
RIVAL(jinit_memory_mgr)
RIVAL(jinit_input_controller)

}  // extern "C"
#pragma GCC visibility pop
