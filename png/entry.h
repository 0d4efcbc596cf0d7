// The exported functions of the PNG decoder that are neither public calls nor the property of one stage.
#pragma once

#include "png/state.h"

// The driver behind all public calls: sets up on the first call, goes on with the decode on later ones. `rows` is the
// number of rows to decode in this call; 0: the limit of an earlier call stays; below 0: none. Internal codes.
PELM_EXPORT uint32_t PELMI_FastImgDecodePng(ImageDecodeInfo *info, void *output, int32_t boxWidth, int32_t boxHeight,
                                            int32_t rows);

// Frees the state in decoderState, if there is one, with all that it owns. Returns 1, also for a NULL `info`.
PELM_EXPORT uint32_t PELMI_DestroyDecodePng(ImageDecodeInfo *info);

static_assert(pelm::lies_on_word(offsetof(PngTrInfo, ownsBlock), 9));
static_assert(pelm::lies_on_word(offsetof(PngTrInfo, block), 10));
static_assert(pelm::lies_on_word(sizeof(PngTrInfo), 11));

// A list of texts, as companion code makes them.
struct PngTextNode {
    void *text; // owned; may be NULL
    uint32_t reserved;
    PngTextNode *next;
};

// Frees all nodes and their texts; the head pointer is left as it is.
PELM_EXPORT void __PELMI_PngFreeTextList(PngTextNode **head);
