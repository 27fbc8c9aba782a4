machine = "AMD EPYC, 2 cores, 2026-12-06 19:52 UTC"
