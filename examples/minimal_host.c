// A complete host for Linux: warms one picture of four pixels with the colour temperature.
// Build: cc -I. examples/minimal_host.c -ldl. Run: ./a.out path/to/libKyvDsp.so
#include "interface/HostInterface.h"

#include <dlfcn.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

int main(int argc, char** argv) {
    void* library = argc > 1 ? dlopen(argv[1], RTLD_NOW) : NULL;
    KyvInitModuleFunction init =
        library ? (KyvInitModuleFunction)dlsym(library, KYV_INIT_MODULE_NAME) : NULL;
    ModuleDescriptor* module;
    if (!init || init(&module) != KYV_OK)
        return 1;

    const EffectDescriptor* effect = module->effects;
    while (strcmp(effect->identifier, "Kyv_Dsp_Co_Temperature") != 0)
        ++effect;

    uint32_t input[4] = {0xFF808080, 0xFF4060A0, 0xFFA06040, 0xFFFFFFFF}, output[4];
    unsigned char params[64]; // at least the sum of all valueSize fields: 12 here
    EffectContext context = {.descriptor = effect, .width = 4, .height = 1, .params = params};
    context.instanceData = calloc(1, effect->instanceDataSize);
    context.cpuLevel = CpuLevel_Avx2;

    effect->callbacks.InitInstance(&context); // the defaults
    float warm = -0.5f;
    memcpy(params, &warm, sizeof warm); // "P1" is the first value
    effect->callbacks.BeginProcessing(&context);
    context.frame = input;
    effect->callbacks.SetInputFrame(0, &context);
    context.frame = output;
    KyvStatus status = effect->callbacks.ProcessFrame(&context);
    for (int i = 0; i < 4; ++i)
        printf("%08X -> %08X\n", (unsigned)input[i], (unsigned)output[i]);

    effect->callbacks.EndProcessing(&context);
    effect->callbacks.DestroyInstance(&context);
    free(context.instanceData);
    return status == KYV_OK ? 0 : 1;
}
