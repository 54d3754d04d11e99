# bitfcns.dask on a LocalCluster of two worker processes on 127.0.0.1: the
# calls and their refusals pickle to the workers and back.
import numpy as np
import pytest

distributed = pytest.importorskip("distributed")

import dask.array as da  # noqa: E402

import bitfcns  # noqa: E402
import bitfcns.dask as bd  # noqa: E402


def test_a_local_cluster_gives_the_single_machine_result():
    whole = (np.arange(4_000_000, dtype=np.uint32) * np.uint32(2654435761) >> np.uint32(13)).astype(np.uint8)
    a = da.from_array(whole, chunks=500_000)
    cluster = distributed.LocalCluster(n_workers=2, threads_per_worker=1, processes=True, host="127.0.0.1",
                                       dashboard_address=None, scheduler_port=0)
    try:
        with distributed.Client(cluster) as client:
            result = client.compute(bd.bitxor(bd.bitcmp(a), a[::-1])).result()
            refusal = client.compute(bd.bitand(a.astype(float) - 1.0, 1.0)).exception()
    finally:
        cluster.close()
    assert np.array_equal(result, bitfcns.bitxor(bitfcns.bitcmp(whole), whole[::-1]))
    assert isinstance(refusal, bitfcns.BitfcnsError) and refusal.identifier == "VESPRA:Bitand:outOfRange"
