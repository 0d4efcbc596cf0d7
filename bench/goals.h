// How fast each kind of work is to be, as a ratio to others that are measured in the same process.
#pragma once

namespace bench {

struct Goal {
    const char *work;
    const char *peer;
    double ratio; // of the peer's time to ours
};

// Besides these: RGB565 is nowhere slower than RGBA.
inline constexpr Goal goals[] = {
    {"png/photo RGB/rgba", "libpng", 2.3},
    {"png/photo RGBA/rgba", "libpng", 2.3},
    {"png/photo grey/rgba", "libpng", 2.9},
    {"png/photo palette/rgba", "libpng", 2.5},
    {"png/photo RGB16/rgba", "libpng", 2.2},
    {"png/photo Adam7/rgba", "libpng", 2.5},
    {"png/illustration RGB/rgba", "libpng", 2.4},
    {"png/screenshot RGB/rgba", "libpng", 3.4},
    {"png/screenshot RGBA/rgba", "libpng", 3.4},
    {"png/text grey/rgba", "libpng", 6.5},
    {"png/text grey1/rgba", "libpng", 8},
    {"png/icons/rgba", "libpng", 1.6},
    {"gif/photo dithered/rgba", "giflib", 2.8},
    {"gif/screenshot/rgba", "giflib", 7},
    {"gif/text two colours/rgba", "giflib", 10},
    {"gif/animation full frames/rgba", "giflib", 2.7},
    {"gif/animation small changes/rgba", "giflib", 6},
    {"bmp/1 bits/rgba", "memcpy", 0.5},
    {"bmp/1 bits/rgba", "stb", 5},
    {"bmp/4 bits/rgba", "memcpy", 0.5},
    {"bmp/4 bits/rgba", "stb", 5},
    {"bmp/8 bits/rgba", "memcpy", 0.5},
    {"bmp/8 bits/rgba", "stb", 5},
    {"bmp/16 bits/rgba", "memcpy", 0.5},
    {"bmp/16 bits/rgba", "stb", 5},
    {"bmp/24 bits/rgba", "memcpy", 0.5},
    {"bmp/24 bits/rgba", "stb", 5},
    {"bmp/32 bits/rgba", "memcpy", 0.5},
    {"bmp/32 bits/rgba", "stb", 5},
    {"wbmp/page/rgba", "memcpy", 0.5},
    {"reduced/png RGB", "libpng rows", 2},
    {"reduced/png palette", "libpng rows", 2},
    {"reduced/png Adam7", "libpng rows", 2},
    {"reduced/gif", "giflib rows", 2},
    {"reduced/bmp 24 bits", "stb whole", 10},
    {"stream/png photo", "memory", 0.91}, // within a tenth: PNG reads the image data twice
    {"stream/png screenshot", "memory", 0.91},
    {"stream/gif photo", "memory", 0.91},
    {"stream/gif screenshot", "memory", 0.91},
    {"stream/bmp 8 bits", "memory", 0.91},
    {"stream/bmp 24 bits", "memory", 0.91},
};

} // namespace bench
