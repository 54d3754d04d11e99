# bitfcns.dask on a LocalCluster of two worker processes on 127.0.0.1, over
# 1e8 elements in chunks, against one call on the same data in this process.
import numpy as np
import pytest

distributed = pytest.importorskip("distributed")

import dask.array as da  # noqa: E402

import bitfcns  # noqa: E402
import bitfcns.dask as bd  # noqa: E402

COUNT = 100_000_000
CHUNK = 12_500_000


def pattern(start, stop, multiplier):
    """Bytes that differ from chunk to chunk, made the same way anywhere."""
    index = np.arange(start, stop, dtype=np.uint32)
    return ((index * np.uint32(multiplier)) >> np.uint32(13)).astype(np.uint8)


def pattern_block(multiplier, block_info=None):
    start, stop = block_info[None]["array-location"][0]
    return pattern(start, stop, multiplier)


def lazy_pattern(multiplier):
    return da.map_blocks(pattern_block, multiplier, chunks=((CHUNK,) * (COUNT // CHUNK),), dtype=np.uint8)


def test_a_local_cluster_gives_the_single_machine_result():
    cluster = distributed.LocalCluster(
        n_workers=2, threads_per_worker=1, processes=True, host="127.0.0.1",
        dashboard_address=None, scheduler_port=0, memory_limit="3GiB",
    )
    try:
        with distributed.Client(cluster) as client:
            a, b = lazy_pattern(2654435761), lazy_pattern(40503)
            lazy = bd.bitxor(bd.bitcmp(a), b)
            distributed_result = client.compute(lazy).result()
            shifted = client.compute(bd.bitshift(a, b[:1].astype(np.int8) - 3)).result()
            refusal = client.compute(bd.bitand(a[:1000].astype(float) - 1.0, 1.0)).exception()
    finally:
        cluster.close()

    whole_a, whole_b = (
        np.concatenate([pattern(start, start + CHUNK, multiplier) for start in range(0, COUNT, CHUNK)])
        for multiplier in (2654435761, 40503)
    )
    assert np.array_equal(distributed_result, bitfcns.bitxor(bitfcns.bitcmp(whole_a), whole_b))
    # A count of one element against every chunk.
    assert np.array_equal(shifted, bitfcns.bitshift(whole_a, whole_b[:1].astype(np.int8) - 3))
    # The first element is -1: the refusal of one call on the whole array.
    assert isinstance(refusal, bitfcns.BitfcnsError) and refusal.identifier == "VESPRA:Bitand:outOfRange"
