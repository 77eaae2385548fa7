// The hand-over of an indication from the IPC layer to the callbacks that the BSP library keeps.
#pragma once

// Calls the callbacks for one indication on the calling thread, which runs the uloop.
void bsp_deliver_ind(int event_id, bool has_record);
