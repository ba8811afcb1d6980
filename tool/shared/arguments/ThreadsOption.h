// The option -j, as every verb has it that works on several files at once.
#pragma once

class Verb;

/// 1 to 256; what is not given stays 0.
void addThreads(Verb& verb, unsigned& threads);
/// That many, or for 0 one per core.
unsigned threadsFor(unsigned asked);
